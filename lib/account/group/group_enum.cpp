// Lists the groups.
#include "tavo_group.h"

#include "account/detail/group_enumeration.h"

extern "C" int TAVOGroupEnum(TLIBSZLIST **ppList, int flags)
{
    return tavo::EnumerateNames(ppList, tavo::kGroupNames, flags, std::nullopt);
}
