// The data volumes that are mounted: /volume1, /volume2 ...
#ifndef TAVO_ACCOUNT_DETAIL_QUOTA_VOLUMES_H
#define TAVO_ACCOUNT_DETAIL_QUOTA_VOLUMES_H

#include <string>
#include <vector>

namespace tavo {

inline constexpr char kVolume[] = "/volume";  // and the number

struct MountedVolume {
    std::string path;
    std::string device;
    bool has_user_quotas = false;  // by its mount options
};

// False when the mounts cannot be read. Throws bad_alloc.
bool ReadMountedVolumes(std::vector<MountedVolume> &volumes);

// By the whole mount point: volume 1 is not mounted because volume 10 is.
bool IsVolumeMounted(int number);

}  // namespace tavo

#endif
