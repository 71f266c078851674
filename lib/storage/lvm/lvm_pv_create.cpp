// Makes a physical volume.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/partition_command.h"

extern "C" int LVMPvCreate(const char *szDevice)
{
    if (!szDevice || !tavo::IsDevicePath(szDevice)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        const std::string beyond = tavo::DeviceBeyondReach(szDevice);
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        constexpr int metadata_kib = 16;
        const std::string metadata = *tavo::ShellCommand("--metadatasize %dK", metadata_kib);
        const auto result = tavo::RunDiskCommand("/sbin/pvcreate -ff -y %s %s > /dev/null 2>&1",
                                                 tavo::ComposedPiece{metadata}, szDevice);
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to '%s'", result.command);
        return -1;
    });
}
