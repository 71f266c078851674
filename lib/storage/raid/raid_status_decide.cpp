// Decides the health of an array.
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/array_level.h"

#include <linux/major.h>
#include <linux/raid/md_u.h>

namespace {

// States are compared whole: only the mask of RAIDDiskCount knows bits.
int CountInState(const RAIDMEMBER *members, int state)
{
    int count = 0;
    for (; members; members = members->pNext)
        count += members->nState == state ? 1 : 0;
    return count;
}

}  // namespace

extern "C" int RAIDStatusDecide(const mdu_array_info_t *pArray, const RAIDMEMBER *pMembers, int *pStatus)
{
    if (!pArray || !pStatus)
        return Fail(ERR_BAD_PARAMETERS);
    const std::optional<int> level = tavo::LevelOfKernel(pArray->level);
    if (!level) {
        LogError("%s:%d unknown raid level: %d", pArray->level);
        return -1;
    }
    const int parity = RAIDParityDiskCount(*level, pArray->raid_disks);
    const int active = CountInState(pMembers, RAID_MEMBER_ACTIVE);
    const int missing = pArray->raid_disks - active;
    if (!pMembers || CountInState(pMembers, RAID_MEMBER_FATAL) > 0)
        *pStatus = RAID_STATUS_CRASHED;
    else if (missing <= 0)
        *pStatus = RAID_STATUS_NORMAL;
    else
        *pStatus = parity >= missing ? RAID_STATUS_DEGRADED : RAID_STATUS_CRASHED;
    return 0;
}
