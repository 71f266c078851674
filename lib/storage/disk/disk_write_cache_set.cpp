// Switches the write cache of a drive.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "storage/detail/caching_page.h"
#include "storage/detail/raw_disk_report.h"

namespace {

constexpr uint8_t kSetFeatures = 0xEF;
constexpr uint8_t kEnableCache = 0x02;
constexpr uint8_t kDisableCache = 0x82;

bool SwitchByPage(int fd, bool on)
{
    auto page = tavo::ReadCachingPage(fd);
    return page && (page->IsOn() == on || tavo::WriteCachingPage(fd, std::move(*page), on));
}

}  // namespace

extern "C" int TAVODiskWriteCacheSet(const char *szPath, int fEnable)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::WithRawDisk(szPath, [&](const tavo::RawDisk &disk) {
        const bool done = disk.IsMarvell() ? SwitchByPage(disk.Descriptor(), fEnable != 0)
                                           : disk.DriveCommand(kSetFeatures, 0, fEnable ? kEnableCache : kDisableCache);
        return done ? 0 : -1;
    });
}
