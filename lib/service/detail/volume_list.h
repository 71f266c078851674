// The appliance's volumes: file systems mounted at /volume1, /volume2, ...
#ifndef TAVO_SERVICE_DETAIL_VOLUME_LIST_H
#define TAVO_SERVICE_DETAIL_VOLUME_LIST_H

#include "core/detail/mount_table.h"
#include "core/detail/volume_path.h"

#include <string>
#include <string_view>
#include <vector>

namespace tavo {

enum VolumeKind : int { kVolumeInternal = 1, kVolumeExternal = 4, kVolumeRemote = 8 };

struct Volume {
    int number = 0;
    std::string path;  // "/volume1"
    std::string source;
    std::string file_system;
    bool writable = false;
};

// Lists the volumes among the mounts, by number. If a path is mounted over, its last mount counts.
std::vector<Volume> VolumesIn(const std::vector<Mount> &mounts);

std::vector<Volume> MountedVolumes();

// Remote by its file system or source; external by a file system of removable disks, or a disk on USB.
VolumeKind KindOf(const Volume &volume);

// Returns the kind of the mounted volume that holds `path`; -1 when there is none.
int VolumeType(std::string_view path);

}  // namespace tavo

#endif
