// Checks whether a partition is an extended one.
#include "tavo_disk.h"
#include "tavo_partition.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/disk_path.h"

extern "C" int PartitionIsExtended(const char *szPath)
{
    // The other two types of extended partitions are made by systems whose disks are not meant to be looked into.
    constexpr uint32_t extended = 0x0F;
    if (!szPath) {
        LogError("%s:%d Bad parameters");
        return 0;
    }
    return Guard([&] {
        DISKPATH path;
        if (DiskPathParse(szPath, &path) != 0 || path.nPartition == 0)
            return 0;
        uint32_t type = 0;
        const int64_t count = RCPartitionConfigs(path.nPartition, tavo::DiskDevice(path).c_str(), nullptr, &type);
        return count >= 0 && type == extended ? 1 : 0;
    });
}
