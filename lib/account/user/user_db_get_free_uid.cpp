// Chooses the next free user id.
#include "tavo_user.h"

#include "account/detail/user_accounts.h"
#include "core/detail/guard.h"

extern "C" int TAVOUserDBGetFreeUid(TAVOUSERDB *pDb)
{
    if (!pDb || !pDb->pUid)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        int32_t uid = -1;
        const tavo::Code code = tavo::FindFreeId(*tavo::Btree::Of(pDb->pUid), tavo::kUids, uid);
        return code == 0 ? uid : Fail(code);
    });
}
