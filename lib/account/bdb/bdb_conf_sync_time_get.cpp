// Reads the modification time of the text file that a store agrees with.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/fault.h"

extern "C" int TAVOBDbConfSyncTimeGet(TAVOBDB *pDb, int32_t *pTime)
{
    if (!pDb || !pTime)
        return Fail(ERR_BAD_PARAMETERS);
    const int code = tavo::Btree::Of(pDb)->GetNumber(tavo::kSyncTimeKey, *pTime);
    return code == 0 ? 0 : Fail(code);
}
