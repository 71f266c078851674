// Reads the saved spin-down minutes.
#include "tavo_disk.h"

#include "core/detail/fault.h"

extern "C" int TAVODiskGetStandbyTimer(int *pnMinute)
{
    if (!pnMinute)
        return Fail(ERR_BAD_PARAMETERS);
    const int minutes = TAVODiskGetFileSBTimerSetting();
    if (minutes < 0)
        return -1;
    *pnMinute = minutes;
    return 0;
}
