// Makes physical volumes, their group and its volume.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/volume_name.h"

#include <cstdio>

extern "C" int LVMCreate(const TLIBSZLIST *pslDevices, const char *szVg, const char *szLv, char *szUuid, int cbUuid)
{
    bool good = pslDevices && pslDevices->nItem > 0 && szVg && szLv && tavo::IsGroupPath(szVg) &&
                tavo::IsVolumeName(szLv) && (!szUuid || cbUuid > 0);
    for (int i = 0; good && i < pslDevices->nItem; ++i)
        good = tavo::IsDevicePath(pslDevices->pszItem[i]);
    if (!good) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        const std::string beyond = tavo::GroupBeyondReach(szVg, *pslDevices);
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        for (int i = 0; i < pslDevices->nItem; ++i) {
            if (LVMPvCreate(pslDevices->pszItem[i]) != 0)
                return -1;
        }
        if (LVMVgCreate(szVg, pslDevices) != 0)
            return -1;
        LVMVG vg;
        if (const int result = LVMVgSBGet(szVg, &vg); result != 1) {
            LogError("%s:%d failed to get VG superblock: %s, ret = %d", szVg, result);
            return -1;
        }
        if (szUuid)
            std::snprintf(szUuid, static_cast<size_t>(cbUuid), "%s", vg.szUuid);
        return LVMLvCreate(szVg, szLv);
    });
}
