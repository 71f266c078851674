// Checks whether a text file has changed since its store was written.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/fault.h"

extern "C" int TAVOBDbIsNeedToRebuild(TAVOBDB *pDb, int64_t mtime)
{
    if (!pDb)
        return Fail(ERR_BAD_PARAMETERS);
    int32_t stored = 0;
    if (const tavo::Code code = tavo::Btree::Of(pDb)->GetNumber(tavo::kSyncTimeKey, stored))
        return Fail(code);
    return stored == static_cast<int32_t>(mtime) ? 0 : 1;
}
