// Computes the size to which an array can grow.
#include "tavo_raid.h"

#include "core/detail/fault.h"

extern "C" int RAIDSizeUnallocGet(const RAIDINFO *pInfo, uint64_t *pcbArray)
{
    if (!pInfo || !pcbArray)
        return Fail(ERR_BAD_PARAMETERS);
    uint64_t kib = 0;
    const int expansible = RAIDExpansible(pInfo, &kib);
    if (expansible < 0)
        return -1;
    const int data = pInfo->nSlot - RAIDParityDiskCount(pInfo->fLevel, pInfo->nSlot);
    *pcbArray = expansible == 1 ? kib * static_cast<uint64_t>(data) * 1024 : pInfo->cbArray;
    return 0;
}
