// The size of a disk or partition, from the kernel.
#ifndef TAVO_STORAGE_DETAIL_DISK_SIZE_H
#define TAVO_STORAGE_DETAIL_DISK_SIZE_H

#include "core/detail/open_file.h"

#include <cstdint>

#include <linux/fs.h>
#include <sys/ioctl.h>

namespace tavo {

inline constexpr uint64_t kSectorSize = 512;

// Drivers of the appliance answer this number; its size field is that of a 32-bit size_t.
static_assert(sizeof(void *) != 4 || BLKGETSIZE64 == 0x80041272);

// In bytes. False with errno.
inline bool AskSize(const Fd &disk, uint64_t &bytes) noexcept
{
    return ::ioctl(disk.Get(), BLKGETSIZE64, &bytes) == 0;
}

}  // namespace tavo

#endif
