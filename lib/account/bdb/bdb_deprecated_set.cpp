// Stores the mark of new stores.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

#include <cerrno>

extern "C" int TAVOBDbDeprecatedSet(TAVOBDB *pDb, int32_t value)
{
    if (!pDb)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (const tavo::Code code = tavo::Btree::Of(pDb)->SetNumber(tavo::kDeprecatedKey, value)) {
            LogError("%s:%d Failed to store a key, errno=%d", errno);
            return Fail(code);
        }
        return 0;
    });
}
