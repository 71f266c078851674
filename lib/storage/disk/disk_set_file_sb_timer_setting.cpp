// Saves the spin-down minutes.
#include "tavo_disk.h"
#include "tavo_file.h"

#include "core/detail/fault.h"

#include <cstdio>

extern "C" int TAVODiskSetFileSBTimerSetting(int nMinute)
{
    if (nMinute < 0)
        return Fail(ERR_BAD_PARAMETERS);
    char text[16];
    std::snprintf(text, sizeof text, "%d", nMinute);
    return TAVOINFOSetKeyValue("standbytimer", text) == 1 ? 0 : -1;
}
