// Reads the SMART data of a drive.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/raw_disk.h"

#include <algorithm>

extern "C" int SmartDataRead(const char *szPath, unsigned char *pBuffer, int fCheck)
{
    if (!szPath || !pBuffer)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::RawDisk disk;
        if (!disk.OpenToRead(szPath))
            return -1;
        tavo::DrivePage page = {};
        if (disk.Command(DISK_COMMAND_SMART_DATA, page.data()) != 0) {
            if (disk.Command(DISK_COMMAND_SMART_ENABLE, nullptr) != 0 ||
                disk.Command(DISK_COMMAND_SMART_DATA, page.data()) != 0)
                return -1;
        }
        tavo::DrivePage thresholds = {};
        if (fCheck && disk.Command(DISK_COMMAND_SMART_THRESHOLDS, thresholds.data()) != 0)
            return -1;
        if (fCheck && !tavo::SumIsZero(page.data())) {
            LogError("%s:%d Wrong checksum of the SMART data of %s", szPath);
            return -1;
        }
        std::copy(page.begin(), page.end(), pBuffer);
        return 0;
    });
}
