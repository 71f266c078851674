// Removes an item of a list: at an index, the first, the last.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/list_block.h"

#include <cstring>

extern "C" char *SzTLIBSzListRemove(TLIBSZLIST *pList, int i)
{
    if (!tavo::HasItem(pList, i))
        return FailNull(ERR_BAD_PARAMETERS, Line{40});
    char **slot = pList->pszItem + i;
    char *removed = *slot;
    --pList->nItem;
    pList->nFree += tavo::kListSlot;
    std::memmove(slot, slot + 1, static_cast<size_t>(pList->nItem - i) * sizeof *slot);
    return removed;
}

extern "C" char *SzTLIBSzListShift(TLIBSZLIST *pList)
{
    if (!pList)
        return FailNull(ERR_BAD_PARAMETERS, Line{78});
    return SzTLIBSzListRemove(pList, 0);
}

extern "C" char *SzTLIBSzListPop(TLIBSZLIST *pList)
{
    if (!pList)
        return FailNull(ERR_BAD_PARAMETERS, Line{110});
    return SzTLIBSzListRemove(pList, pList->nItem - 1);
}
