// Checks whether a group name is acceptable.
#include "tavo_group.h"

#include "account/detail/account_name.h"

extern "C" int BlTLIBIsGroupName(const char *szName)
{
    return tavo::IsAccountName(szName, tavo::kGroupNameChars) ? 1 : 0;
}
