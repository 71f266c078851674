// Finds the data volumes among the mounts.
#include "account/detail/quota_volumes.h"

#include "core/detail/mount_table.h"

#include <algorithm>
#include <string_view>

namespace tavo {
namespace {

bool IsVolume(std::string_view path)
{
    constexpr std::string_view begin = kVolume;
    return path.starts_with(begin) && path.size() > begin.size() &&
           std::all_of(path.begin() + begin.size(), path.end(), [](char byte) { return byte >= '0' && byte <= '9'; });
}

}  // namespace

bool ReadMountedVolumes(std::vector<MountedVolume> &volumes)
{
    std::vector<Mount> mounts;
    if (!ReadMounts(mounts))
        return false;
    for (const Mount &mount : mounts)
        if (IsVolume(mount.point))
            volumes.push_back(
                {mount.point, mount.source,
                 mount.Has("usrquota") || mount.Has("usrjquota") || mount.Has("quota") || mount.Has("uquota")});
    return true;
}

bool IsVolumeMounted(int number)
{
    std::vector<MountedVolume> volumes;
    const std::string path = kVolume + std::to_string(number);
    return ReadMountedVolumes(volumes) && std::any_of(volumes.begin(), volumes.end(),
                                                      [&](const MountedVolume &volume) { return volume.path == path; });
}

}  // namespace tavo
