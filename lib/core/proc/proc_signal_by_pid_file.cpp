// Signals the process that a pid file names.
#include "tavo_proc.h"

#include "core/detail/fault.h"
#include "core/detail/pid_file.h"

extern "C" int TLIBProcSignalByPidFile(const char *szPath, int signal)
{
    if (!szPath || signal < 0)
        return Fail(ERR_BAD_PARAMETERS);
    switch (tavo::SignalByPidFile(szPath, signal)) {
    case tavo::PidSignal::sent:
        return 0;
    case tavo::PidSignal::no_pid:
        return Fail(ERR_OPEN_FAILED);
    case tavo::PidSignal::failed:
        break;
    }
    return Fail(ERR_SYS_UNKNOWN);
}
