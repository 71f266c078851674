// Waits for the rebuilds of several arrays.
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"

extern "C" int RAIDRebuildingMultiWait(const TLIBSZLIST *pslPaths)
{
    if (!pslPaths)
        return Fail(ERR_BAD_PARAMETERS);
    for (int i = 0; i < pslPaths->nItem; ++i) {
        if (RAIDRebuildingWait(pslPaths->pszItem[i]) != 0) {
            LogError("%s:%d Failed to wait RAID status: %s", pslPaths->pszItem[i]);
            return -1;
        }
    }
    return 0;
}
