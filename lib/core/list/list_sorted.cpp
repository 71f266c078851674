// Returns how a list is sorted.
#include "tavo_list.h"

#include "core/detail/fault.h"

extern "C" int TLIBSzListSorted(const TLIBSZLIST *pList)
{
    if (!pList)
        return Fail(ERR_BAD_PARAMETERS, Line{26});
    return pList->fMode;
}
