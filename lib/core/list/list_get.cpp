// Reads one item of a list.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/list_block.h"

extern "C" char *SzTLIBSzListGet(const TLIBSZLIST *pList, int i)
{
    if (!tavo::HasItem(pList, i))
        return FailNull(ERR_BAD_PARAMETERS, Line{30});
    return pList->pszItem[i];
}
