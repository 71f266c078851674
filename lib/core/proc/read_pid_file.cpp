// Reads the process id in a pid file.
#include "tavo_proc.h"

#include "core/detail/fault.h"
#include "core/detail/pid_file.h"

extern "C" pid_t TLIBReadPidFile(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    const std::optional<pid_t> pid = tavo::ReadPidFile(szPath);
    return pid ? *pid : Fail(ERR_OPEN_FAILED);
}
