// Checks whether a stick carries a FAT or NTFS file system without a partition table.
#include "tavo_disk.h"

#include "storage/detail/boot_sector.h"

extern "C" int TAVOIsUSBDiskFATNoPartition(const char *szPath)
{
    tavo::BootSector sector;
    return szPath && tavo::ReadBootSector(szPath, sector) == 0 && tavo::IsWindowsVolume(sector) ? 1 : 0;
}
