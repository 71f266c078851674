// Notifies the appliance's event daemon of a change.
#include "tavo_appliance.h"

#include "appliance/detail/daemon_signal.h"
#include "core/detail/fault.h"

extern "C" int TLIBScemdNotify(int signal)
{
    return tavo::SignalDaemon("/var/run/scemd.pid", signal) ? 0 : Fail(ERR_SYS_UNKNOWN);
}
