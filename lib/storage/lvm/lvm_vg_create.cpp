// Makes a volume group.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/partition_command.h"
#include "storage/detail/volume_name.h"

namespace {

bool AreDevices(const TLIBSZLIST *devices)
{
    for (int i = 0; devices && i < devices->nItem; ++i) {
        if (!tavo::IsDevicePath(devices->pszItem[i]))
            return false;
    }
    return devices && devices->nItem > 0;
}

}  // namespace

extern "C" int LVMVgCreate(const char *szVg, const TLIBSZLIST *pslDevices)
{
    if (!szVg || !tavo::IsGroupPath(szVg) || !AreDevices(pslDevices)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        const std::string beyond = tavo::GroupBeyondReach(szVg, *pslDevices);
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        std::string devices;
        for (int i = 0; i < pslDevices->nItem; ++i)
            devices.append(" ").append(pslDevices->pszItem[i]);
        tavo::CommandResult result;
        for (int attempt = 0; attempt < 2; ++attempt) {
            result = tavo::RunDiskCommand("/sbin/vgcreate %s %s > /dev/null 2>&1", szVg, tavo::ComposedPiece{devices});
            if (result.status == 0)
                return 0;
        }
        LogError("%s:%d Failed to '%s', errno=%d", result.command, result.status);
        return -1;
    });
}
