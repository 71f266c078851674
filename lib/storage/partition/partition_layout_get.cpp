// Finds the layout version that the system disks carry.
#include "tavo_appliance.h"
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/model_setting.h"
#include "storage/detail/device_name.h"
#include "storage/detail/disk_path.h"

#include <string>

#include <glob.h>

namespace {

constexpr int kLastSystemArray = 99;

class Members {
  public:
    Members() : error_(::glob("/sys/block/md0/md/dev-*", 0, nullptr, &found_)) {}
    ~Members() { ::globfree(&found_); }
    Members(const Members &) = delete;
    Members &operator=(const Members &) = delete;

    bool Failed() const { return error_ != 0 && error_ != GLOB_NOMATCH; }
    size_t Count() const { return error_ == 0 ? found_.gl_pathc : 0; }
    std::string Disk(size_t i) const
    {
        const std::string_view path = found_.gl_pathv[i];
        return std::string(tavo::WithoutNumber(path.substr(path.rfind('-') + 1)));
    }

  private:
    glob_t found_ = {};
    int error_;
};

int VersionOfMembers(const Members &members)
{
    int version = 0;
    for (size_t i = 0; i < members.Count() && version == 0; ++i)
        BlTAVOCheckPartitionLayout(members.Disk(i).c_str(), 1, &version);
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
        const Members members;
        if (members.Failed()) {
            LogError("%s:%d Failed to list the members of the system array");
            return -1;
        }
        const int version = members.Count() > 0 ? VersionOfMembers(members) : VersionOfBays();
        *pVersion = version ? version : int{PARTITION_VERSION_CURRENT};
        return 0;
    });
}
