// Counts the arrays of a list.
#include "tavo_raid.h"

extern "C" int RAIDListCount(const RAIDLIST *pList)
{
    int count = 0;
    for (; pList; pList = pList->pNext)
        ++count;
    return count;
}
