// Checks whether a user name is acceptable.
#include "tavo_user.h"

#include "account/detail/account_name.h"

extern "C" int BlTLIBIsUserName(const char *szName)
{
    return tavo::IsAccountName(szName, tavo::kUserNameChars) ? 1 : 0;
}
