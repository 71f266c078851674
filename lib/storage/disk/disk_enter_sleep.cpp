// Puts a drive to sleep.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "storage/detail/raw_disk_report.h"

#include <cstdint>

namespace {

constexpr uint8_t kFlushCache = 0xE7;
constexpr uint8_t kSleep = 0xE6;
constexpr uint8_t kOldSleep = 0x99;  // of drives from before the other number

}  // namespace

extern "C" int TAVOIDiskEnterSleep(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::WithRawDisk(szPath, [&](const tavo::RawDisk &disk) {
        disk.DriveCommand(kFlushCache);
        return disk.DriveCommand(kSleep) || disk.DriveCommand(kOldSleep) ? 0 : -1;
    });
}
