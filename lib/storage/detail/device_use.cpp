// The kernel's uses of a disk or partition.
#include "storage/detail/device_use.h"

#include "core/detail/mount_table.h"
#include "core/detail/open_file.h"
#include "storage/detail/device_name.h"
#include "storage/detail/matching_paths.h"

#include <algorithm>

namespace tavo {
namespace {

std::string Sentence(const std::string &path, const std::string &user)
{
    return path + " is in use: " + user;
}

bool IsMounted(const std::string &device)
{
    std::vector<Mount> mounts;
    ReadMounts(mounts);  // as far as it can be read
    return std::any_of(mounts.begin(), mounts.end(), [&](const Mount &mount) { return mount.source == device; });
}

}  // namespace

std::string HoldersOf(std::string_view name)
{
    const std::string pattern = "/sys/class/block/" + std::string(name) + "/holders/*";
    std::string holders;
    if (const auto found = MatchingPaths(pattern))
        for (const std::string &path : *found)
            holders.append(holders.empty() ? "" : " ").append(LastPart(path.c_str()));
    return holders;
}

std::string UserOf(const std::string &path)
{
    const std::string holders = HoldersOf(WithoutDev(path));
    if (!holders.empty())
        return holders;
    // For block devices this means: unless the kernel itself uses it.
    return !OpenFd(path.c_str(), O_RDONLY | O_EXCL) && errno == EBUSY ? "a file system or swap" : "";
}

std::string UsedPartition(const std::string &disk, int first, int last)
{
    bool any = false;
    for (int number = 1; number <= kLastPartition; ++number) {
        const std::string path = disk + std::to_string(number);
        const std::string user = UserOf(path);
        if (!user.empty() && number >= first && number <= last)
            return Sentence(path, user);
        any = any || !user.empty();
    }
    // A disk counts as used when a partition of it is, and partitions of an older table do when the disk is.
    if (any && IsMounted(disk))
        return Sentence(disk, "a file system");
    const std::string user = any ? HoldersOf(WithoutDev(disk)) : UserOf(disk);
    return user.empty() ? "" : Sentence(disk, user);
}

}  // namespace tavo
