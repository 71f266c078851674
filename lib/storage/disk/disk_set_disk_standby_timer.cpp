// Sets the spin-down timer of one drive.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "storage/detail/raw_disk_report.h"

extern "C" int TAVOIDiskSetDiskStandbyTimer(const char *szPath, int nValue)
{
    constexpr uint8_t idle = 0xE3;
    if (!szPath || nValue < 0 || nValue > 255)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::WithRawDisk(szPath, [&](const tavo::RawDisk &disk) {
        unsigned char value = static_cast<unsigned char>(nValue);
        if (disk.IsMarvell())
            return disk.Command(DISK_COMMAND_SET_TIMER, &value);
        return disk.DriveCommand(idle, value) ? 0 : -1;
    });
}
