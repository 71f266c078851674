// Opens a store.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "account/detail/store_mode.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

#include <cerrno>

extern "C" TAVOBDB *TAVOBDbOpen(const char *szPath, int flags, int fBtreeInfo)
{
    if (!szPath || !*szPath)
        return FailNull(ERR_BAD_PARAMETERS);
    return Guard([&]() -> TAVOBDB * {
        const tavo::Btree::Options options{flags, fBtreeInfo == 1, tavo::StoreMode()};
        std::unique_ptr<tavo::Btree> store;
        if (const int code = tavo::Btree::Open(szPath, options, store)) {
            LogError("%s:%d Failed to open %s, errno=%d", szPath, errno);
            return FailNull(code);
        }
        return store.release();
    });
}
