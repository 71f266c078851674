// The verbs of tavoctl service that change something.
#ifndef TAVOCTL_SERVICE_H
#define TAVOCTL_SERVICE_H

namespace tavoctl {

class Family;

void AddServiceSwitches(Family &service);
void AddServiceVolumes(Family &service);

}  // namespace tavoctl

#endif
