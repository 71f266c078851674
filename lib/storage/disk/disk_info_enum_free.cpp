// Frees the list of DiskInfoEnum.
#include "tavo_disk.h"

#include <cstdlib>

extern "C" void DiskInfoEnumFree(DISKLIST *pList)
{
    while (pList) {
        DISKLIST *const next = pList->pNext;
        DiskInfoFree(pList->pInfo);
        std::free(pList);
        pList = next;
    }
}
