// Checks whether a disk or partition is large enough for an array.
#ifndef TAVO_STORAGE_DETAIL_MEMBER_SIZE_H
#define TAVO_STORAGE_DETAIL_MEMBER_SIZE_H

#include "tavo_raid.h"

#include "storage/detail/disk_size.h"

#include <cstdint>

namespace tavo {

// For what the array uses of each member. A superblock needs room, too: mdadm has the last word.
inline bool HoldsMember(const RAIDINFO &info, uint64_t sectors)
{
    constexpr uint64_t rounding = 256;
    return sectors >= (info.cbMember + rounding) / kSectorSize;
}

}  // namespace tavo

#endif
