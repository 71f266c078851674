// Empties a list and keeps its block.
#include "tavo_list.h"

#include "core/detail/list_block.h"

extern "C" void TLIBSzListRemoveAll(TLIBSZLIST *pList)
{
    if (!pList)
        return;
    pList->nItem = 0;
    pList->nFree = pList->nSize - tavo::kListHeader;
    pList->EndofFree = tavo::ListEnd(pList);
}
