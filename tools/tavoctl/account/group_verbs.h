// The verbs of the group family, by the file that they are in.
#ifndef TAVOCTL_GROUP_VERBS_H
#define TAVOCTL_GROUP_VERBS_H

namespace tavoctl {

class Family;

void AddGroupChanges(Family &group);
void AddGroupTransfer(Family &group);
void AddGroupCheck(Family &group);

}  // namespace tavoctl

#endif
