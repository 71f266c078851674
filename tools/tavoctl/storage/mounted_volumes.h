// The volumes that are mounted: /volume1, /volume2, ...
#ifndef TAVOCTL_MOUNTED_VOLUMES_H
#define TAVOCTL_MOUNTED_VOLUMES_H

#include "frame/arguments.h"

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

extern const ArgumentKind volume_kind;  // the number of one

}  // namespace tavoctl

#endif
