// Lists the accounts.
#include "tavo_user.h"

#include "account/detail/user_enumeration.h"

extern "C" int TAVOUserEnum(TLIBSZLIST **ppList, int flags)
{
    return tavo::EnumerateNames(ppList, tavo::kUserNames, flags, std::nullopt);
}
