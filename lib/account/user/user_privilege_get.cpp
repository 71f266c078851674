// Tells the application privilege bits of an account.
#include "tavo_user.h"

#include "account/detail/user_owner.h"

#include <strings.h>

extern "C" int TAVOUserPrivilegeGet(const char *szName)
{
    tavo::UserOwner user;
    if (TAVOUserGet(szName, user.Fill()) != 0)
        return -1;
    if (user->nKind == TAVO_USER_KIND_DOMAIN)
        return TAVO_USER_PRIVILEGE_DOMAIN;
    return ::strcasecmp(user->szName, "guest") == 0 ? 0 : user->nPrivilege;
}
