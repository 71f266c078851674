// Reads the temperature of a drive.
#include "tavo_disk.h"

#include "core/detail/log.h"
#include "storage/detail/drive_page.h"

extern "C" int TAVODiskTemperatureGet(const char *szPath)
{
    tavo::DrivePage page;
    if (SmartDataRead(szPath, page.data(), 0) != 0) {
        LogError("%s(%d) read value %s fail", szPath);
        return -1;
    }
    return tavo::SmartTemperature(page).value_or(-1);
}
