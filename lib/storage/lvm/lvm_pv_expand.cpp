// Has the physical volumes of a group use the whole of their devices.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/partition_command.h"

extern "C" int LVMPvExpand(const LVMVGINFO *pInfo)
{
    if (!pInfo || !pInfo->pslPvs) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        // Its volume would fill it.
        const std::string beyond = tavo::GroupBeyondReach(pInfo->szVg, *pInfo->pslPvs);
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        int result = 0;
        for (int i = 0; i < pInfo->pslPvs->nItem; ++i) {
            const char *const device = pInfo->pslPvs->pszItem[i];
            if (!tavo::IsDevicePath(device)) {
                LogError("%s:%d Bad parameters");
                result = -1;
                continue;
            }
            const auto resized = tavo::RunDiskCommand("/sbin/pvresize %s > /dev/null 2>&1", device);
            if (resized.status == 0)
                continue;
            LogError("%s:%d Failed to do '%s'", resized.command);
            result = -1;
        }
        return result;
    });
}
