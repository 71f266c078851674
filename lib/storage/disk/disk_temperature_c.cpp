// Reads the temperature of a drive, for the health of an array.
#include "tavo_disk.h"

#include "core/detail/log.h"
#include "storage/detail/drive_page.h"

extern "C" int TAVODiskTemperatureC(const char *szPath)
{
    tavo::DrivePage page;
    if (SmartDataRead(szPath, page.data(), 0) != 0) {
        LogError("%s(%d)Failed to get status of RAID Temperature");
        return -1;
    }
    return tavo::SmartTemperature(page).value_or(-1);
}
