// Opens a store.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

#include <cerrno>

namespace {

constexpr mode_t kModeOfOthers = 0666;  // of stores that do not belong to the account families

}  // namespace

extern "C" TAVOBDB *TAVOBDbOpen(const char *szPath, int flags, int fBtreeInfo)
{
    if (!szPath || !*szPath)
        return FailNull(ERR_BAD_PARAMETERS);
    return Guard([&]() -> TAVOBDB * {
        const tavo::Btree::Options options{flags, fBtreeInfo == 1, kModeOfOthers};
        std::unique_ptr<tavo::Btree> store;
        if (const tavo::Code code = tavo::Btree::Open(szPath, options, store)) {
            LogError("%s:%d Failed to open %s, errno=%d", szPath, errno);
            return FailNull(code);
        }
        return store.release();
    });
}
