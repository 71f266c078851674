// Fills the record of a volume group.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/list_owner.h"
#include "core/detail/log.h"

#include <cstring>
#include <memory>

extern "C" int LVMVgSB2Info(const LVMVG *pVg, LVMVGINFO *pInfo)
{
    // Devices outside every group have the empty UUID.
    if (!pVg || !pInfo || pVg->szUuid[0] == 0) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    LVMPVLIST *all = nullptr;
    if (LVMPvSBEnum(&all) < 0)
        return -1;
    const std::unique_ptr<LVMPVLIST, decltype(&LVMPvSBListFree)> owner(all, LVMPvSBListFree);
    tavo::ListOwner paths(PslTLIBSzListAlloc(128));
    if (!paths)
        return Fail(ERR_OUT_OF_MEMORY);
    for (const LVMPVLIST *node = all; node; node = node->pNext) {
        if (std::strcmp(node->pv.szUuid, pVg->szUuid) == 0 && TLIBSzListPush(paths.Addr(), node->pv.szPv) < 0)
            return -1;
    }
    std::memcpy(pInfo->szVg, pVg->szVg, sizeof pInfo->szVg);
    std::memcpy(pInfo->szUuid, pVg->szUuid, sizeof pInfo->szUuid);
    pInfo->nPv = paths->nItem;
    pInfo->fValid = 1;
    TLIBSzListFree(pInfo->pslPvs);
    pInfo->pslPvs = paths.Release();
    return 0;
}
