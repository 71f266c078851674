// Finds the user that a quota is about.
#include "account/detail/quota_user.h"

#include "account/detail/group_owner.h"
#include "account/detail/user_owner.h"
#include "core/detail/keep_fault.h"

namespace tavo {

int FindQuotaUser(const char *name, int32_t &uid)
{
    const KeepFault keep;
    UserOwner user;
    if (TAVOUserGet(name, user.Fill()) == 0) {
        uid = user->nUid;
        return 0;
    }
    const int code = tavoerrno;
    if (code != ERR_NO_SUCH_USER && code != ERR_INVALID_USERNAME)
        return code;
    // Groups have no quotas, whichever way they are spelled in lists of names.
    GroupOwner group;
    if (*name == '@' || TAVOGroupGet(name, group.Fill()) == 0)
        return ERR_SYS_UNKNOWN;
    return ERR_NO_SUCH_USER;
}

}  // namespace tavo
