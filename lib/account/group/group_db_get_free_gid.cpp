// Chooses the next free group id.
#include "tavo_group.h"

#include "account/detail/group_accounts.h"
#include "core/detail/guard.h"

extern "C" int TAVOGroupDBGetFreeGid(TAVOGROUPDB *pDb)
{
    if (!pDb || !pDb->pGid)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        int32_t gid = -1;
        const int code = tavo::FindFreeId(*tavo::Btree::Of(pDb->pGid), tavo::kGids, gid);
        return code == 0 ? gid : Fail(code);
    });
}
