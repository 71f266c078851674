// The verbs of tavoctl disk that change a drive's state.
#ifndef TAVOCTL_DISK_POWER_H
#define TAVOCTL_DISK_POWER_H

namespace tavoctl {

class Family;

void AddDiskPower(Family &disk);

}  // namespace tavoctl

#endif
