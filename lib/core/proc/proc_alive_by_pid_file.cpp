// Tells whether the process that a pid file names is there.
#include "tavo_proc.h"

extern "C" int TLIBProcAliveByPidFile(const char *szPath)
{
    return TLIBProcSignalByPidFile(szPath, 0) == 0;
}
