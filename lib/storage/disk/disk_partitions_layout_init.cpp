// Clears a layout.
#include "tavo_disk.h"

#include <cstring>

extern "C" void DiskPartitionsLayoutInit(TavoPartitionLayout *pLayout)
{
    if (!pLayout)
        return;
    std::memset(pLayout, 0, sizeof *pLayout);
    // The last entry stays 0 for compatibility: callers take the index of an entry from its place.
    for (int32_t i = 0; i < DISK_LAYOUT_ENTRIES - 1; ++i)
        pLayout->rgEntry[i].iEntry = i;
}
