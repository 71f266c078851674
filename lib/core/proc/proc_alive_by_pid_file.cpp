// Checks whether the process that a pid file names exists.
#include "tavo_proc.h"

extern "C" int TLIBProcAliveByPidFile(const char *szPath)
{
    return TLIBProcSignalByPidFile(szPath, 0) == 0;
}
