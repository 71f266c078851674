// Checks whether an account has expired.
#include "tavo_user.h"

#include "account/detail/user_owner.h"

extern "C" int TAVOUserCheckExpired(const char *szName)
{
    tavo::UserOwner user;
    if (TAVOUserGet(szName, user.Fill()) != 0)
        return -1;
    return TAVOUserIsExpired(user->nExpired);
}
