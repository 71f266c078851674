// Prints a list for debugging.
#include "tavo_list.h"

#include <cstdio>

extern "C" void TLIBISzListDump(const TLIBSZLIST *pList)
{
    if (!pList)
        return;
    std::printf("%p start address \n", static_cast<const void *>(pList));
    for (int i = 0; i < pList->nItem; ++i)
        std::printf("%p ,%p pszItem[%i]=%s\n", static_cast<void *>(pList->pszItem[i]),
                    static_cast<const void *>(&pList->pszItem[i]), i, pList->pszItem[i]);
    std::printf("nSize =%i \t nItem =%i \t nFree =%i \t fMode =%i \t EndofFree=%p\n", pList->nSize, pList->nItem,
                pList->nFree, pList->fMode, static_cast<void *>(pList->EndofFree));
}
