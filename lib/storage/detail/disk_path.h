// Paths of disks: /dev/sd, one letter or two, and the number of a partition.
#ifndef TAVO_STORAGE_DETAIL_DISK_PATH_H
#define TAVO_STORAGE_DETAIL_DISK_PATH_H

#include "tavo_disk.h"

#include <string>

namespace tavo {

struct ParsedDiskPath {
    enum class Outcome { good, no_disk, bad_tail };

    Outcome outcome;
    DISKPATH path;     // when good
    const char *tail;  // the character that is wrong, for a bad tail
};

ParsedDiskPath ParseDiskPath(const char *text);

// The whole disk: "/dev/sda" or "/dev/sdab".
std::string DiskDevice(const DISKPATH &path);

// "/dev/sda" to "/dev/sdj": the disks whose power is managed.
inline constexpr int kPowerDisks = 10;
std::string PortDevice(int index);  // from 0

}  // namespace tavo

#endif
