// Writes an empty partition table.
#include "tavo_partition.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/partition_command.h"

extern "C" int PartitionAddTable(const char *szDisk)
{
    if (!szDisk || !tavo::IsDevicePath(szDisk)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        const std::string beyond = tavo::DeviceBeyondReach(szDisk);
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        const tavo::CommandResult result = tavo::RunDiskCommand("/sbin/sfdisk -M1 %s > /dev/null 2>&1", szDisk);
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to add ms-dos signature to %s, err=%d", szDisk, result.status);
        return -1;
    });
}
