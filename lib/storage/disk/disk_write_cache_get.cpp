// Checks whether the write cache of a drive is on.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/caching_page.h"
#include "storage/detail/raw_disk.h"

extern "C" int TAVODiskWriteCacheGet(const char *szPath)
{
    if (!szPath)
        return FailNone(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::RawDisk disk;
        if (const tavo::Code code = disk.Open(szPath))
            return FailNone(code);
        if (disk.IsMarvell()) {
            const auto page = tavo::ReadCachingPage(disk.Descriptor());
            return page && page->IsOn() ? 1 : 0;
        }
        tavo::DrivePage identity = {};
        if (!disk.Identify(identity)) {
            tavo::LogBare("%s HDIO_DRIVE_CMD(identify) failed", szPath);
            return 0;
        }
        return tavo::HasWriteCacheOn(identity) ? 1 : 0;
    });
}
