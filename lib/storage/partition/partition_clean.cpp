// Empties the partitions of a disk.
#include "tavo_partition.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/partition_command.h"

namespace {

constexpr int kFirstData = 3;
constexpr int kLastData = 15;

// From the last one on: a logical partition that goes renumbers those behind it. Most are not there.
void Empty(const char *disk, int number)
{
    const tavo::CommandResult result =
        tavo::RunDiskCommand("/sbin/sfdisk -N%d -q -f --no-reread -o0 -z0 -t0 -F -D %s > /dev/null 2>&1", number, disk);
    if (result.status != 0)
        LogDebug("%s:%d Failed to do '%s'", result.command);
}

int CleanSystem(const char *disk)
{
    for (const int number : {1, 2}) {
        // The kernel forgets partition 2 with the first empty table, so its superblock may not be there to erase any
        // more; partitions made anew get new superblocks.
        PartitionCleanRAID(disk, number);
        Empty(disk, number);
        if (PartitionAddTable(disk) != 0)
            return -1;
    }
    return 0;
}

}  // namespace

extern "C" int PartitionClean(const char *szDisk, int flags)
{
    if (!szDisk || !tavo::IsDevicePath(szDisk)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        if ((flags & PARTITION_DATA) != 0) {
            for (int number = kLastData; number >= kFirstData; --number)
                Empty(szDisk, number);
            PartitionCleanRAID(szDisk, kFirstData);
        }
        return (flags & PARTITION_SYSTEM) != 0 ? CleanSystem(szDisk) : 0;
    });
}
