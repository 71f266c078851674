// What the md driver says about an open array and its members.
#include "storage/detail/array_members.h"

#include "core/detail/owner.h"
#include "storage/detail/bounded_text.h"
#include "storage/detail/device_name.h"

#include <cstdlib>
#include <string>

#include <linux/raid/md_p.h>
#include <unistd.h>

namespace tavo {
namespace {

constexpr int kMostNumbers = 1024;  // numbers are never used twice in an array's life, so they have gaps

std::string DevicePath(unsigned major_number, unsigned minor_number)
{
    const std::string number = std::to_string(major_number) + ":" + std::to_string(minor_number);
    char target[4096];
    const ssize_t length = ::readlink(("/sys/dev/block/" + number).c_str(), target, sizeof target);
    if (length <= 0)
        return "/dev/block/" + number;
    return std::string(kDev).append(LastPart({target, static_cast<size_t>(length)}));
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

bool ReadMembers(int fd, const mdu_array_info_t &array, bool has_no_redundancy, RAIDMEMBER **members)
{
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
        CopyBounded(member->szPath, DevicePath(static_cast<unsigned>(disk.major), static_cast<unsigned>(disk.minor)));
        member->nState = MemberState(disk.state, has_no_redundancy);
        ++found;
    }
    return true;
}

bool IsRebuildAction(const char *action)
{
    const std::string_view word = action;
    return word == "resync" || word == "recover" || word == "reshape";
}

}  // namespace tavo
