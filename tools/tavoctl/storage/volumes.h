// The volumes: /volume1 is the file system on /dev/vg1/lv.
#ifndef TAVOCTL_VOLUMES_H
#define TAVOCTL_VOLUMES_H

#include "frame/column.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

struct Volume {
    std::string group;                         // "vg1"
    std::string device;                        // "/dev/vg1/lv"
    std::vector<std::string> devices;          // under the group: "md2"
    bool active;                               // the kernel has it
    std::optional<Bytes> size;                 // of the device
    std::string mount;                         // empty: not mounted
    std::optional<Bytes> capacity, available;  // of the mounted file system

    // Of "vg1": 1; nothing for a group of another name.
    std::optional<int> Number() const;
};

// Those that the kernel has, without reading a disk; with all also those of groups that are not active, which reads
// them.
std::vector<Volume> ReadVolumes(bool all);

inline constexpr char volume_help[] = "its number, 1 for /volume1";

std::string VolumePath(int number);     // "/volume1"
std::string VolumeGroupOf(int number);  // "/dev/vg1"

// An ext2, ext3 or ext4 file system, by the first blocks of its device.
struct ExtFileSystem {
    uint64_t size;  // bytes
    bool clean;     // no errors were noticed while it was mounted
};
std::optional<ExtFileSystem> ReadExtFileSystem(const std::string &device);

}  // namespace tavoctl

#endif
