// Frees the record of a volume group.
#include "tavo_lvm.h"

#include <cstdlib>

extern "C" void LVMVgInfoFree(LVMVGINFO *pInfo)
{
    if (!pInfo)
        return;
    TLIBSzListFree(pInfo->pslPvs);
    std::free(pInfo);
}
