// Stores the value of a key.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "account/detail/store_bytes.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

#include <cerrno>

extern "C" int TAVOBDbSet(TAVOBDB *pDb, const void *pKey, int cbKey, const void *pValue, int cbValue)
{
    if (!pDb || !pKey || cbKey <= 0 || !pValue || cbValue < 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (const tavo::Code code =
                tavo::Btree::Of(pDb)->Set(tavo::BytesOf(pKey, cbKey), tavo::BytesOf(pValue, cbValue))) {
            LogError("%s:%d Failed to store a key, errno=%d", errno);
            return Fail(code);
        }
        return 0;
    });
}
