// Lists the accounts whose name holds a text.
#include "tavo_user.h"

#include "account/detail/user_enumeration.h"

extern "C" int TAVOUserEnumBySubstr(TLIBSZLIST **ppList, int flags, const char *szText)
{
    return tavo::EnumerateNames(ppList, tavo::kUserNames, flags,
                                tavo::NameSearch{szText, tavo::NameSearch::Where::anywhere});
}
