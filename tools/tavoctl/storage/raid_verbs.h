// The verbs of tavoctl raid that change arrays.
#ifndef TAVOCTL_RAID_VERBS_H
#define TAVOCTL_RAID_VERBS_H

#include "frame/verb.h"

namespace tavoctl {

Action RaidCreate(Arguments &in);
Action RaidAdd(Arguments &in);
Action RaidTakeOut(Arguments &in);
Action RaidGrow(Arguments &in);
Action RaidMigrate(Arguments &in);
Action RaidHalt(Arguments &in);
Action RaidErase(Arguments &in);
Action RaidStart(Arguments &in);
Action RaidReplace(Arguments &in);
Action RaidScrub(Arguments &in);
Action RaidSpeed(Arguments &in);
Action RaidWait(Arguments &in);

// Waits until an array is not being rebuilt; throws a Failure when it is not in order then, or after so many seconds; 0:
// no limit.
void WaitForArray(const std::string &path, int64_t timeout);

}  // namespace tavoctl

#endif
