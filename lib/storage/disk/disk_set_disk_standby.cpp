// Spins one disk down.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/raw_disk_report.h"

extern "C" int TAVOIDiskSetDiskStandby(const char *szPath)
{
    if (!szPath) {
        LogError("%s:%d argument should not be NULL");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return tavo::WithRawDisk(szPath, [&](const tavo::RawDisk &disk) {
        unsigned char state = 0;
        if (disk.Command(DISK_COMMAND_CHECK_POWER, &state) != 0)
            return -1;
        // Some drives spin up for the command when they are down already.
        return state == 0 ? 0 : disk.Command(DISK_COMMAND_STANDBY, nullptr);
    });
}
