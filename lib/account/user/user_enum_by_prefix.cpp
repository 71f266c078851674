// Lists the accounts whose name begins with a text.
#include "tavo_user.h"

#include "account/detail/user_enumeration.h"

extern "C" int TAVOUserEnumByPrefix(TLIBSZLIST **ppList, int flags, const char *szText)
{
    return tavo::EnumerateNames(ppList, tavo::kUserNames, flags,
                                tavo::NameSearch{szText, tavo::NameSearch::Where::beginning});
}
