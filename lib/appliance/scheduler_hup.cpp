// Makes the download scheduler read the accounts again.
#include "tavo_appliance.h"

#include "appliance/detail/daemon_signal.h"
#include "core/detail/fault.h"

extern "C" int TAVOSchedulerHup(int signal)
{
    return tavo::SignalDaemon("/var/run/scheduler.pid", signal) ? 0 : Fail(ERR_SYS_UNKNOWN);
}
