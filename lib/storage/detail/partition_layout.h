// Finds a layout of the table by what is on a disk.
#ifndef TAVO_STORAGE_DETAIL_PARTITION_LAYOUT_H
#define TAVO_STORAGE_DETAIL_PARTITION_LAYOUT_H

#include "tavo_partition.h"

#include <cstring>

namespace tavo {

// The first layout whose RAID flag and first two partitions are these; NULL without one. Partition 3 depends on the
// disk's size and is never compared.
inline const TAVOPARTLAYOUT *FindLayout(uint32_t raid, const TAVOPARTPLACE &first, const TAVOPARTPLACE &second)
{
    for (const TAVOPARTLAYOUT &layout : grgAllTavoPartLayout) {
        if (layout.fRaid == raid && std::memcmp(&layout.place1, &first, sizeof first) == 0 &&
            std::memcmp(&layout.place2, &second, sizeof second) == 0)
            return &layout;
    }
    return nullptr;
}

}  // namespace tavo

#endif
