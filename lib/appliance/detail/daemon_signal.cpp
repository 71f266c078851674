// Signals to daemons of the appliance that may or may not run.
#include "appliance/detail/daemon_signal.h"

#include "tavo_proc.h"

#include "core/detail/keep_fault.h"

namespace tavo {

bool SignalDaemon(const char *pid_file, int signal)
{
    const KeepFault keep;
    return TLIBProcAliveByPidFile(pid_file) == 0 || TLIBProcSignalByPidFile(pid_file, signal) == 0;
}

}  // namespace tavo
