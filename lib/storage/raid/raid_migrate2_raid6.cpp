// Turns a RAID 5 into a RAID 6.
#include "tavo_disk.h"
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/device_use.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/member_size.h"
#include "storage/detail/open_disk.h"
#include "storage/detail/partition_command.h"

namespace {

bool AddMembers(const RAIDINFO &info, const TLIBSZLIST &members, int first, int end)
{
    for (int i = first; i < end; ++i) {
        if (RAIDAdd(&info, members.pszItem[i]) != 0)
            return false;
    }
    return true;
}

// Returns whether one of them is in use, or is known to be too small: the level cannot be changed back.
bool IsUnfit(const RAIDINFO &info, const TLIBSZLIST &members)
{
    for (int i = 0; i < members.nItem; ++i) {
        const char *const member = members.pszItem[i];
        uint64_t sectors = 0;
        const std::string user = tavo::UserOf(member);
        if (!user.empty())
            LogError("%s:%d %s is in use: %s", member, user);
        else if (tavo::HasNode(member) && DiskSizeGet(member, &sectors) == 1 && !tavo::HoldsMember(info, sectors))
            LogError("%s:%d '%s' is too small for '%s'", member, info.szPath);
        else
            continue;
        return true;
    }
    return false;
}

}  // namespace

extern "C" int RAIDMigrate2RAID6(const RAIDINFO *pInfo, const TLIBSZLIST *pslMembers)
{
    const auto array = pInfo ? tavo::ArrayNumber(pInfo->szPath) : std::nullopt;
    bool good = array && pInfo->fLevel == RAID_LEVEL_5 && pslMembers && pslMembers->nItem > 0;
    for (int i = 0; good && i < pslMembers->nItem; ++i)
        good = tavo::IsMemberPath(pslMembers->pszItem[i]);
    if (!good) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        if (IsUnfit(*pInfo, *pslMembers))
            return -1;
        const std::string beyond = tavo::ArrayBeyondReach(pInfo->szPath, {.level = RAID_LEVEL_6,
                                                                          .slots = pslMembers->nItem - 1,
                                                                          .member_limit = pInfo->cbMember,
                                                                          .members = nullptr});
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        const auto result = tavo::RunDiskCommand("/bin/echo raid6  > /sys/block/md%d/md/level", *array);
        if (result.status != 0) {
            LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
            return -1;
        }
        if (!AddMembers(*pInfo, *pslMembers, 0, 1))
            return -1;
        if (pslMembers->nItem == 1)
            return 0;
        if (RAIDRebuildingWait(pInfo->szPath) != 0 || !AddMembers(*pInfo, *pslMembers, 1, pslMembers->nItem))
            return -1;
        const int slots = pslMembers->nItem - 1;
        if (RAIDDevCountChange(pInfo, slots) == 0)
            return 0;
        LogError("%s:%d Failed to change disk count (%d) of RAID [%s]", slots, pInfo->szPath);
        return -1;
    });
}
