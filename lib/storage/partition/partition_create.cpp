// Creates the partitions of a system disk.
#include "tavo_partition.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/model_setting.h"
#include "storage/detail/device_name.h"
#include "storage/detail/device_use.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/partition_command.h"

namespace {

constexpr unsigned kRaidMember = 0xFD;
constexpr unsigned kLinux = 0x83;
constexpr unsigned kSwap = 0x82;
constexpr int kData = 3;

int Report(const tavo::CommandResult &result)
{
    if (result.status == 0)
        return 0;
    LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
    return -1;
}

int CreateData(const char *disk, const TAVOPARTLAYOUT &layout, bool raid)
{
    return Report(tavo::RunDiskCommand("/sbin/sfdisk -N%d -uS -q -f -j%llu -z-1 -t%x -F %s >/dev/null 2>&1", kData,
                                       uint64_t{layout.cGap}, raid ? kRaidMember : kLinux, disk));
}

int CreateSystem(const char *disk, const TAVOPARTLAYOUT &layout, bool raid)
{
    if (PartitionAddTable(disk) != 0)
        return -1;
    if (Report(tavo::RunDiskCommand("/sbin/sfdisk -N1 -uS -q -f -j%llu -z%llu -t%x -F %s > /dev/null 2>&1",
                                    int64_t{layout.place1.nStart}, uint64_t{layout.cSector1},
                                    raid ? kRaidMember : kLinux, disk)) != 0)
        return -1;
    return Report(tavo::RunDiskCommand("/sbin/sfdisk -N2 -uS -q -f -j0 -z%llu -t%x -F %s > /dev/null 2>&1",
                                       uint64_t{layout.cSector2}, raid ? kRaidMember : kSwap, disk));
}

}  // namespace

extern "C" int PartitionCreate(const char *szDisk, int flags, const int *pVersion)
{
    if (!szDisk || !tavo::IsDevicePath(szDisk)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        int version = pVersion ? *pVersion : 0;
        if (!pVersion && PartitionLayoutGet(&version) != 0) {
            LogError("%s:%d Failed to get the partition layout of the system");
            return -1;
        }
        const bool raid = tavo::ModelHas("supportraid");
        const int index = TAVOPartitionLayoutIdxGet(version, raid ? 1 : 0);
        if (index < 0) {
            LogError("%s:%d Failed to get partition layout: version=%d", version);
            return -1;
        }
        const bool data = (flags & PARTITION_DATA) != 0;
        if (!data && (flags & PARTITION_SYSTEM) == 0)
            return 0;
        const std::string beyond = tavo::DeviceBeyondReach(szDisk);
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        // The empty table that the system's partitions begin with takes all others along.
        const int first = data ? kData : 1;
        const std::string used = tavo::UsedPartition(szDisk, first, data ? kData : tavo::kLastPartition);
        if (!used.empty()) {
            LogError("%s:%d %s", used);
            return -1;
        }
        const TAVOPARTLAYOUT &layout = grgAllTavoPartLayout[index];
        return data ? CreateData(szDisk, layout, raid) : CreateSystem(szDisk, layout, raid);
    });
}
