// The md driver's description of an open array and its members.
#include "storage/detail/array_members.h"

#include "core/detail/owner.h"
#include "storage/detail/array_level.h"
#include "storage/detail/bounded_text.h"
#include "storage/detail/device_name.h"
#include "storage/detail/member_node.h"

#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

#include <linux/raid/md_p.h>
#include <unistd.h>

namespace tavo {
namespace {

constexpr int kMostNumbers = 1024;  // numbers are never used twice in an array's life, so they have gaps

struct DeviceNumber {
    unsigned major_number;
    unsigned minor_number;
};

// The node of a device; empty when the device is gone.
std::string DevicePath(DeviceNumber device)
{
    const std::string number = std::to_string(device.major_number) + ":" + std::to_string(device.minor_number);
    char target[4096];
    const ssize_t length = ::readlink(("/sys/dev/block/" + number).c_str(), target, sizeof target);
    if (length <= 0)
        return {};
    return std::string(kDev).append(LastPart({target, static_cast<size_t>(length)}));
}

bool HasPath(const RAIDMEMBER *members, std::string_view path)
{
    while (members && members->szPath != path)
        members = members->pNext;
    return members != nullptr;
}

// The name that md keeps for a member whose device is gone. It follows from the number; where it does not, the only
// name that no other member has is it.
std::string PulledPath(int array, DeviceNumber device, const RAIDMEMBER *members)
{
    const std::string name = ScsiName(device.major_number, device.minor_number);
    if (!name.empty() && IsMemberName(array, name))
        return std::string(kDev) + name;
    for (const std::string &known : MemberNames(array)) {
        const std::string path = std::string(kDev) + known;
        if (!HasPath(members, path))
            return path;
    }
    return std::string(kDev) + "block/" + std::to_string(device.major_number) + ":" +
           std::to_string(device.minor_number);
}

}  // namespace

void FreeMembers(RAIDMEMBER *members) noexcept
{
    const KeepErrno keep;
    while (members) {
        RAIDMEMBER *const next = members->pNext;
        std::free(members);
        members = next;
    }
}

int MemberState(int kernel_state, bool has_no_redundancy)
{
    if ((kernel_state & (1 << MD_DISK_FAULTY)) != 0)
        return has_no_redundancy ? RAID_MEMBER_FATAL : RAID_MEMBER_FAILED;
    constexpr int in_sync = 1 << MD_DISK_ACTIVE | 1 << MD_DISK_SYNC;
    return (kernel_state & in_sync) == in_sync ? RAID_MEMBER_ACTIVE : RAID_MEMBER_SPARE;
}

bool ReadMembers(int fd, int array_number, const mdu_array_info_t &array, RAIDMEMBER **members)
{
    const bool has_no_redundancy = HasNoRedundancy(LevelOfKernel(array.level).value_or(0));
    std::vector<std::pair<RAIDMEMBER *, DeviceNumber>> pulled;
    RAIDMEMBER **end = members;
    *end = nullptr;
    int found = 0;
    for (int number = 0; number < kMostNumbers && found < array.nr_disks; ++number) {
        mdu_disk_info_t disk = {};
        disk.number = number;
        if (::ioctl(fd, GET_DISK_INFO, &disk) != 0 || (disk.major == 0 && disk.minor == 0))
            continue;
        RAIDMEMBER *const member = static_cast<RAIDMEMBER *>(std::calloc(1, sizeof(RAIDMEMBER)));
        if (!member)
            return false;
        *end = member;
        end = &member->pNext;
        const DeviceNumber device = {static_cast<unsigned>(disk.major), static_cast<unsigned>(disk.minor)};
        CopyBounded(member->szPath, DevicePath(device));
        if (!member->szPath[0])
            pulled.emplace_back(member, device);
        member->nState = MemberState(disk.state, has_no_redundancy);
        ++found;
    }
    for (const auto &[member, device] : pulled)
        CopyBounded(member->szPath, PulledPath(array_number, device, *members));
    return true;
}

bool IsRebuildAction(const char *action)
{
    const std::string_view word = action;
    return word == "resync" || word == "recover" || word == "reshape";
}

}  // namespace tavo
