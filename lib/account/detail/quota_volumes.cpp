// Finds the data volumes among the mounts.
#include "account/detail/quota_volumes.h"

#include <algorithm>
#include <memory>
#include <string_view>

#include <mntent.h>

namespace tavo {
namespace {

struct EndMounts {
    void operator()(FILE *mounts) const noexcept { ::endmntent(mounts); }
};

bool IsVolume(std::string_view path)
{
    constexpr std::string_view begin = kVolume;
    return path.starts_with(begin) && path.size() > begin.size() &&
           std::all_of(path.begin() + begin.size(), path.end(), [](char byte) { return byte >= '0' && byte <= '9'; });
}

}  // namespace

bool ReadMountedVolumes(std::vector<MountedVolume> &volumes)
{
    const std::unique_ptr<FILE, EndMounts> mounts(::setmntent("/proc/self/mounts", "re"));
    if (!mounts)
        return false;
    mntent entry;
    std::vector<char> text(16384);  // overlays have options of several pages
    while (::getmntent_r(mounts.get(), &entry, text.data(), static_cast<int>(text.size()))) {
        if (!IsVolume(entry.mnt_dir))
            continue;
        const bool quotas = ::hasmntopt(&entry, "usrquota") || ::hasmntopt(&entry, "usrjquota") ||
                            ::hasmntopt(&entry, "quota") || ::hasmntopt(&entry, "uquota");
        volumes.push_back({entry.mnt_dir, entry.mnt_fsname, quotas});
    }
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
