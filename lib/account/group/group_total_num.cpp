// Counts the groups.
#include "tavo_group.h"

#include "account/detail/group_enumeration.h"

extern "C" int TAVOGroupTotalNum(int flags)
{
    return tavo::CountNames(tavo::kGroupNames, flags);
}
