// Counts the accounts.
#include "tavo_user.h"

#include "account/detail/user_enumeration.h"

extern "C" int TAVOUserTotalNum(int flags)
{
    return tavo::CountNames(tavo::kUserNames, flags);
}
