// Checks whether an array can use more of its members.
#include "tavo_appliance.h"
#include "tavo_disk.h"
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/open_disk.h"

#include <algorithm>
#include <cstdint>

extern "C" int RAIDExpansible(const RAIDINFO *pInfo, uint64_t *pcKibMember)
{
    if (!pInfo || !pcKibMember)
        return Fail(ERR_BAD_PARAMETERS);
    if ((pInfo->fLevel & (RAID_LEVEL_1 | RAID_LEVEL_5 | RAID_LEVEL_6)) == 0 || !pInfo->pMembers)
        return 0;
    uint64_t sectors = UINT64_MAX;
    for (const RAIDMEMBER *member = pInfo->pMembers; member; member = member->pNext) {
        if (!tavo::HasNode(member->szPath))  // pulled: its replacement has to fit
            continue;
        uint64_t size = 0;
        if (DiskSizeGet(member->szPath, &size) != 1) {
            LogError("%s:%d Failed to get the size of %s", member->szPath);
            return -1;
        }
        sectors = std::min(sectors, size);
    }
    if (sectors == UINT64_MAX)
        return 0;
    uint64_t kib = sectors / 2;
    if (const unsigned long limit = RAIDSizeLimitGet())
        kib = std::min<uint64_t>(kib, limit);
    constexpr uint64_t superblock = 1024;  // and the other metadata before and after the data
    kib -= std::min(kib, superblock);
    if (kib <= pInfo->cbMember / 1024)
        return 0;
    *pcKibMember = kib;
    return 1;
}
