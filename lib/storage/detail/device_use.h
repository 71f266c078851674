// The kernel's uses of a disk or partition: checked before the first change, so that no change stays incomplete.
#ifndef TAVO_STORAGE_DETAIL_DEVICE_USE_H
#define TAVO_STORAGE_DETAIL_DEVICE_USE_H

#include <string>
#include <string_view>

namespace tavo {

inline constexpr int kLastPartition = 15;

// The devices on top of the one of that kernel name ("md0"), separated by blanks; empty without any.
std::string HoldersOf(std::string_view name);

// Returns the users of the device of that path: its holders, else "a file system or swap". Empty when it is unused or
// does not exist.
std::string UserOf(const std::string &path);

// The same for partitions first to last of a disk, as "/dev/sda3 is in use: md2"; also for the disk itself when a file
// system or an array has the whole of it.
std::string UsedPartition(const std::string &disk, int first, int last);

}  // namespace tavo

#endif
