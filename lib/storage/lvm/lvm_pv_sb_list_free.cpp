// Frees a list of physical volumes.
#include "tavo_lvm.h"

#include <cstdlib>

extern "C" void LVMPvSBListFree(LVMPVLIST *pList)
{
    while (pList) {
        LVMPVLIST *const next = pList->pNext;
        std::free(pList);
        pList = next;
    }
}
