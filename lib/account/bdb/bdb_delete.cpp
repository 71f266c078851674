// Deletes a key.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "account/detail/store_bytes.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

#include <cerrno>

extern "C" int TAVOBDbDelete(TAVOBDB *pDb, const void *pKey, int cbKey)
{
    if (!pDb || !pKey || cbKey <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (const tavo::Code code = tavo::Btree::Of(pDb)->Delete(tavo::BytesOf(pKey, cbKey))) {
            if (code != ERR_KEY_NOT_FOUND)
                LogError("%s:%d Failed to delete a key, errno=%d", errno);
            return Fail(code);
        }
        return 0;
    });
}
