// Counts members by their state.
#include "tavo_raid.h"

extern "C" int RAIDDiskCount(const RAIDMEMBER *pMembers, int fState)
{
    int count = 0;
    for (; pMembers; pMembers = pMembers->pNext)
        count += (pMembers->nState & fState) != 0 ? 1 : 0;
    return count;
}
