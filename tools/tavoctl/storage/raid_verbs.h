// The verbs of tavoctl raid that change arrays.
#ifndef TAVOCTL_RAID_VERBS_H
#define TAVOCTL_RAID_VERBS_H

#include "frame/verb.h"

namespace tavoctl {

Action RaidCreate(Arguments &in);
Action RaidAdd(Arguments &in);
Action RaidTakeOut(Arguments &in);
Action RaidMigrate(Arguments &in);
Action RaidHalt(Arguments &in);
Action RaidStart(Arguments &in);
Action RaidErase(Arguments &in);

}  // namespace tavoctl

#endif
