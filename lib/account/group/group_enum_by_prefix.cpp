// Lists the groups whose name begins with a text.
#include "tavo_group.h"

#include "account/detail/group_enumeration.h"

extern "C" int TAVOGroupEnumByPrefix(TLIBSZLIST **ppList, int flags, const char *szText)
{
    return tavo::EnumerateNames(ppList, tavo::kGroupNames, flags,
                                tavo::NameSearch{szText, tavo::NameSearch::Where::beginning});
}
