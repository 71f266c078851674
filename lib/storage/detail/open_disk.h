// Looks whether a disk has a device node, without touching the disk.
#ifndef TAVO_STORAGE_DETAIL_OPEN_DISK_H
#define TAVO_STORAGE_DETAIL_OPEN_DISK_H

#include "core/detail/open_file.h"

namespace tavo {

// Where nodes come and go with the disks, an empty bay has none. False only then.
inline bool HasNode(const char *path) noexcept
{
    return OpenFd(path, O_PATH) || errno != ENOENT;
}

}  // namespace tavo

#endif
