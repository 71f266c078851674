// Finds the layout version that the system disks carry.
#include "tavo_appliance.h"
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/model_setting.h"
#include "storage/detail/device_name.h"
#include "storage/detail/disk_path.h"
#include "storage/detail/matching_paths.h"

#include <string>

namespace {

constexpr int kLastSystemArray = 99;

int VersionOfMembers(const std::vector<std::string> &members)
{
    int version = 0;
    for (size_t i = 0; i < members.size() && version == 0; ++i) {
        const std::string name = members[i].substr(members[i].rfind('-') + 1);
        BlTAVOCheckPartitionLayout(std::string(tavo::WithoutNumber(name)).c_str(), 1, &version);
    }
    return version;
}

// On a model with RAID only a disk that belongs to an array counts: a foreign one may have such sectors too.
int VersionOfBays()
{
    const bool raid = tavo::ModelHas("supportraid");
    const int bays = TAVOMaxDiskGet();
    int version = 0;
    for (int i = 0; i < bays && version == 0; ++i) {
        const std::string disk = tavo::PortDevice(i);
        if (BlTAVOCheckPartitionLayout(disk.c_str(), raid ? 1 : 0, &version) != 1 || !raid)
            continue;
        int array = -1;
        if (RAIDDiskIsUsedByRAID(disk.c_str(), &array) != 1 || array > kLastSystemArray)
            version = 0;
    }
    return version;
}

}  // namespace

extern "C" int PartitionLayoutGet(int *pVersion)
{
    if (!pVersion) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        const auto members = tavo::MatchingPaths("/sys/block/md0/md/dev-*");
        if (!members) {
            LogError("%s:%d Failed to list the members of the system array");
            return -1;
        }
        const int version = members->empty() ? VersionOfBays() : VersionOfMembers(*members);
        *pVersion = version ? version : int{PARTITION_VERSION_CURRENT};
        return 0;
    });
}
