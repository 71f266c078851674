// Closes a store.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/fault.h"
#include "core/detail/log.h"

#include <cerrno>

extern "C" int TAVOBDbClose(TAVOBDB *pDb)
{
    if (!pDb)
        return Fail(ERR_BAD_PARAMETERS);
    const std::unique_ptr<tavo::Btree> store(tavo::Btree::Of(pDb));
    if (store->Close() != 0) {
        LogError("%s:%d Failed to close a store, errno=%d", errno);
        return Fail(ERR_DB_CLOSE);
    }
    return 0;
}
