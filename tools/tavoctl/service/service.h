// The verbs of tavoctl service that change something.
#ifndef TAVOCTL_SERVICE_H
#define TAVOCTL_SERVICE_H

#include "frame/verb.h"

namespace tavoctl {

Action ServiceEnable(Arguments &in);
Action ServiceDisable(Arguments &in);
Action ServiceStart(Arguments &in);
Action ServiceStop(Arguments &in);
Action ServiceRestart(Arguments &in);
Action ServiceReload(Arguments &in);
Action ServiceVolume(Arguments &in);
Action ServiceRestore(Arguments &in);

}  // namespace tavoctl

#endif
