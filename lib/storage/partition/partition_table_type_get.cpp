// Finds the kind of a disk's partition table.
#include "tavo_partition.h"

#include "core/detail/log.h"
#include "storage/detail/boot_sector.h"

extern "C" int PartitionTableTypeGet(const char *szPath, int *pKind)
{
    if (!szPath || !pKind) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    tavo::BootSector sector;
    if (const tavo::Code code = tavo::ReadBootSector(szPath, sector)) {
        LogError("%s:%d TAVOReadOneSectorFromDev failed. szDevPath=[%s], errno=[0x%04X]", szPath, code);
        return -1;
    }
    *pKind = tavo::TableKind(sector);
    LogError("%s:%d pTable %d", *pKind);
    return 0;
}
