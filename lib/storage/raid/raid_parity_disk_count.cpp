// Returns how many disks a level can lose.
#include "tavo_raid.h"

#include "core/detail/log.h"

extern "C" int RAIDParityDiskCount(int fLevel, int nDisk)
{
    switch (fLevel) {
    case RAID_LEVEL_0:
    case RAID_LEVEL_LINEAR:
        return 0;
    case RAID_LEVEL_1:
        return nDisk - 1;
    case RAID_LEVEL_5:
        return 1;
    case RAID_LEVEL_6:
        return 2;
    case RAID_LEVEL_10:  // at best: one disk of each pair
        return nDisk / 2;
    default:
        LogDebug("%s:%d bad parameters: unknown raid level='%d'", fLevel);
        return -1;
    }
}
