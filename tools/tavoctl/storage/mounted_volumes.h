// The volumes that are mounted: /volume1, /volume2, ...
#ifndef TAVOCTL_MOUNTED_VOLUMES_H
#define TAVOCTL_MOUNTED_VOLUMES_H

#include <string>
#include <vector>

namespace tavoctl {

struct MountedVolume {
    int number;
    std::string path;
    std::string device;
};

std::vector<MountedVolume> MountedVolumes();  // by number
MountedVolume FindVolume(int number);         // throws a Failure when it is not mounted
MountedVolume FindVolume(const std::string &number);

}  // namespace tavoctl

#endif
