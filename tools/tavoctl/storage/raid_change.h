// The verbs of tavoctl raid that change arrays.
#ifndef TAVOCTL_RAID_CHANGE_H
#define TAVOCTL_RAID_CHANGE_H

namespace tavoctl {

class Family;

void AddRaidChange(Family &raid);

}  // namespace tavoctl

#endif
