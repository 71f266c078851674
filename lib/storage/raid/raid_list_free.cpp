// Frees a list of arrays.
#include "tavo_raid.h"

#include <cstdlib>

extern "C" void RAIDListFree(RAIDLIST *pList)
{
    while (pList) {
        RAIDLIST *const next = pList->pNext;
        RAIDInfoFree(pList->pInfo);
        std::free(pList);
        pList = next;
    }
}
