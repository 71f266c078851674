// Finds the layout of a version in the table.
#include "tavo_partition.h"

extern "C" int TAVOPartitionLayoutIdxGet(int version, int fRaid)
{
    if (version == 0)
        version = PARTITION_VERSION_CURRENT;
    int index = 0;
    for (const TAVOPARTLAYOUT &layout : grgAllTavoPartLayout) {
        if (layout.nVersion == version && layout.fRaid == static_cast<uint32_t>(fRaid))
            return index;
        ++index;
    }
    return -1;
}
