// Asks for the power state of a drive, without waking it.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "storage/detail/raw_disk_report.h"

extern "C" int TAVOIDiskCheckPower(const char *szPath, unsigned char *pState)
{
    if (!szPath || !pState)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::WithRawDisk(szPath, [&](const tavo::RawDisk &disk) {
        unsigned char state = 0;
        if (disk.Command(DISK_COMMAND_CHECK_POWER, &state) != 0)
            return -1;
        *pState = state;
        return 0;
    });
}
