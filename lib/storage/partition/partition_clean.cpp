// Empties the partitions of a disk.
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/device_use.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/open_disk.h"
#include "storage/detail/partition_command.h"

namespace {

constexpr int kFirstData = 3;
constexpr int kLastSystem = 2;

// Called from the last partition down: removing a logical partition renumbers those after it. Most do not exist.
void Empty(const char *disk, int number)
{
    const tavo::CommandResult result =
        tavo::RunDiskCommand("/sbin/sfdisk -N%d -q -f --no-reread -o0 -z0 -t0 -F -D %s > /dev/null 2>&1", number, disk);
    if (result.status != 0)
        LogDebug("%s:%d Failed to do '%s'", result.command);
}

// The partition that keeps its node until its superblock is erased: 3 of the data partitions, 1 of the system's.
bool IsReached(int number)
{
    return number == 1 || number == kFirstData;
}

// Erases superblocks that the commands below would miss, and that would start the old array when the partitions are
// made again.
int EraseFirst(const std::string &disk, int first, int last)
{
    for (int number = first; number <= last; ++number) {
        const std::string member = disk + std::to_string(number);
        RAIDSUPERBLOCK superblock;
        if (!IsReached(number) && tavo::HasNode(member.c_str()) && RAIDSBGet(member.c_str(), &superblock) == 1 &&
            superblock.szUuid[0] && PartitionCleanRAID(disk.c_str(), number) != 0)
            return -1;
    }
    return 0;
}

int CleanSystem(const char *disk)
{
    for (int number = 1; number <= kLastSystem; ++number) {
        // The kernel forgets partition 2 with the first empty table, so this fails for it: EraseFirst was there.
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
        const bool data = (flags & PARTITION_DATA) != 0;
        const bool system = (flags & PARTITION_SYSTEM) != 0;
        if (!data && !system)
            return 0;
        const std::string beyond = tavo::DeviceBeyondReach(szDisk);
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        // The empty table of the system's partitions takes all the others along.
        const int first = system ? 1 : kFirstData;
        const std::string used = tavo::UsedPartition(szDisk, first, tavo::kLastPartition);
        if (!used.empty()) {
            LogError("%s:%d %s", used);
            return -1;
        }
        if (EraseFirst(szDisk, first, data ? tavo::kLastPartition : kLastSystem) != 0)
            return -1;
        if (data) {
            for (int number = tavo::kLastPartition; number >= kFirstData; --number)
                Empty(szDisk, number);
            PartitionCleanRAID(szDisk, kFirstData);
        }
        return system ? CleanSystem(szDisk) : 0;
    });
}
