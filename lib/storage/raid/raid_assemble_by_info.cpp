// Starts an array from the members of its record.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_level.h"
#include "storage/detail/array_name.h"
#include "storage/detail/kernel_text.h"
#include "storage/detail/mdadm_examine.h"
#include "storage/detail/open_disk.h"
#include "storage/detail/partition_command.h"
#include "storage/detail/unfinished_array.h"

#include <string>
#include <vector>

#include <linux/major.h>
#include <linux/raid/md_u.h>

namespace {

// mdadm takes a list of members as what must be there: it starts nothing without one of them.
std::string AllMembers(const RAIDINFO &info)
{
    std::string members;
    for (const RAIDMEMBER *member = info.pMembers; member; member = member->pNext)
        members.append(" ").append(member->szPath);
    return members;
}

// The members of one array that are there, and the status that they make.
struct Remaining {
    std::string uuid;
    int status = RAID_STATUS_CRASHED;
};

Remaining Look(const RAIDINFO &info)
{
    Remaining remaining;
    std::vector<RAIDMEMBER> members;
    for (const RAIDMEMBER *member = info.pMembers; member; member = member->pNext) {
        RAIDSUPERBLOCK superblock;
        if (!tavo::HasNode(member->szPath) || RAIDSBGet(member->szPath, &superblock) != 1 ||
            !tavo::IsArrayUuid(superblock.szUuid))
            continue;
        if (remaining.uuid.empty())
            remaining.uuid = superblock.szUuid;
        if (tavo::IsSameArrayUuid(remaining.uuid, superblock.szUuid))
            members.push_back(*member);
    }
    for (size_t i = 0; i < members.size(); ++i)
        members[i].pNext = i + 1 < members.size() ? &members[i + 1] : nullptr;
    mdu_array_info_t array = {};
    array.level = tavo::KernelOfLevel(info.fLevel).value_or(0);
    array.raid_disks = info.nSlot;
    RAIDStatusDecide(&array, members.empty() ? nullptr : members.data(), &remaining.status);
    return remaining;
}

// An array that mdadm has assembled but not started holds its members.
void LetGo(const RAIDINFO &info, int number)
{
    if (tavo::KernelText(tavo::ArrayFile(number, "md/array_state")) == "inactive")
        tavo::RunDiskCommand("/sbin/mdadm -S %s > /dev/null 2>&1", info.szPath);
}

}  // namespace

extern "C" int RAIDAssembleByInfo(const RAIDINFO *pInfo)
{
    const auto number = pInfo ? tavo::ArrayNumber(pInfo->szPath) : std::nullopt;
    bool good = number && pInfo->pMembers;
    for (const RAIDMEMBER *member = good ? pInfo->pMembers : nullptr; member; member = member->pNext)
        good = good && tavo::IsMemberPath(member->szPath);
    if (!good) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        const std::string members = AllMembers(*pInfo);
        auto result =
            tavo::RunDiskCommand("/sbin/mdadm -A %s%s > /dev/null 2>&1", pInfo->szPath, tavo::ComposedPiece{members});
        if (result.status == 0) {
            tavo::GoOnWithArray(*number);
            return 0;
        }
        const Remaining remaining = Look(*pInfo);
        LetGo(*pInfo, *number);
        if (remaining.status == RAID_STATUS_DEGRADED) {
            result = tavo::RunDiskCommand("/sbin/mdadm -A %s -u %s > /dev/null 2>&1", pInfo->szPath, remaining.uuid);
            if (result.status == 0) {
                tavo::GoOnWithArray(*number);
                return 0;
            }
        }
        LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
        return -1;
    });
}
