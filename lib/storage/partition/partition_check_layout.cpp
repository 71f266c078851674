// Checks whether a disk carries a layout of the system.
#include "tavo_partition.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/partition_layout.h"

namespace {

bool Query(const char *disk, int number, TAVOPARTPLACE &place)
{
    int64_t start = 0;
    uint32_t type = 0;
    const int64_t count = RCPartitionConfigs(number, disk, &start, &type);
    if (count < 0) {
        LogDebug("%s:%d %s: dont contain partition [%d]", disk, number);
        return false;
    }
    place = {start, count, type};
    return true;
}

}  // namespace

extern "C" int BlTAVOCheckPartitionLayout(const char *szDisk, int fRaid, int *pVersion)
{
    if (!szDisk)
        return 0;
    TAVOPARTPLACE first;
    TAVOPARTPLACE second;
    if (!Query(szDisk, 1, first) || !Query(szDisk, 2, second))
        return 0;
    const TAVOPARTLAYOUT *const layout = tavo::FindLayout(static_cast<uint32_t>(fRaid), first, second);
    if (!layout)
        return 0;
    if (pVersion)
        *pVersion = layout->nVersion;
    return 1;
}
