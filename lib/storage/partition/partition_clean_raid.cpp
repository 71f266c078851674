// Erases the RAID superblock of a partition.
#include "tavo_partition.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/partition_command.h"

extern "C" int PartitionCleanRAID(const char *szDisk, int nPartition)
{
    if (!szDisk || nPartition < 1 || !tavo::IsDevicePath(szDisk)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        const tavo::CommandResult result =
            tavo::RunDiskCommand("/sbin/mdadm --zero-superblock %s%d > /dev/null 2>&1", szDisk, nPartition);
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
        return -1;
    });
}
