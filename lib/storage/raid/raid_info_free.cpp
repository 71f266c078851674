// Frees an array record with its members.
#include "tavo_raid.h"

#include "storage/detail/array_members.h"

#include <cstdlib>

extern "C" void RAIDInfoFree(RAIDINFO *pInfo)
{
    if (!pInfo)
        return;
    tavo::FreeMembers(pInfo->pMembers);
    std::free(pInfo);
}
