// The first sector of a disk: a partition table, or a file system without one.
#ifndef TAVO_STORAGE_DETAIL_BOOT_SECTOR_H
#define TAVO_STORAGE_DETAIL_BOOT_SECTOR_H

#include "core/detail/result.h"

#include <array>
#include <cstddef>

namespace tavo {

inline constexpr size_t kSectorBytes = 512;
using BootSector = std::array<unsigned char, kSectorBytes>;

// Reads it: 0, or ERR_OPEN_FAILED or ERR_READ_FAILED.
Code ReadBootSector(const char *path, BootSector &sector);

bool HasTableSignature(const BootSector &sector);

// PARTITION_TABLE_ of tavo_partition.h.
int TableKind(const BootSector &sector);

// Returns whether the sector is the boot sector of a FAT16, FAT32 or NTFS file system and its first table entry is not
// a partition.
bool IsWindowsVolume(const BootSector &sector);

}  // namespace tavo

#endif
