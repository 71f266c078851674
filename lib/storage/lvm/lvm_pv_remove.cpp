// Makes a device no physical volume any more.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/partition_command.h"

extern "C" int LVMPvRemove(const char *szDevice)
{
    if (!szDevice || !tavo::IsDevicePath(szDevice)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        const auto result = tavo::RunDiskCommand("/sbin/pvremove -ff -y %s > /dev/null 2>&1", szDevice);
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to '%s'", result.command);
        return -1;
    });
}
