// Chooses the next free user id.
#include "tavo_user.h"

#include "account/detail/id_index.h"
#include "core/detail/guard.h"

namespace {

constexpr tavo::IdRange kUids{tavo::kCurrentUidKey, TAVO_USER_UID_MIN, TAVO_USER_UID_MAX, ERR_TOO_MANY_USERS};

}  // namespace

extern "C" int TAVOUserDBGetFreeUid(TAVOUSERDB *pDb)
{
    if (!pDb || !pDb->pUid)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        int32_t uid = -1;
        const int code = tavo::FindFreeId(*tavo::Btree::Of(pDb->pUid), kUids, uid);
        return code == 0 ? uid : Fail(code);
    });
}
