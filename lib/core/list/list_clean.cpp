// Removes the holes of a list.
#include "tavo_list.h"

#include "core/detail/list_block.h"

#include <algorithm>

extern "C" void TLIBISzListClean(TLIBSZLIST *pList)
{
    if (!pList)
        return;
    char **end = std::remove(pList->pszItem, pList->pszItem + pList->nItem, pList->pszEmpty);
    const auto kept = static_cast<int32_t>(end - pList->pszItem);
    pList->nFree += tavo::kListSlot * (pList->nItem - kept);
    pList->nItem = kept;
}
