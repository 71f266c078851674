// Resets a drive.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "storage/detail/raw_disk_report.h"

#include <linux/hdreg.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace {

constexpr unsigned kComesBack = 10;  // seconds

}  // namespace

extern "C" int TAVOIDiskReset(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::WithRawDisk(szPath, [&](const tavo::RawDisk &disk) {
        int result = ::ioctl(disk.Descriptor(), HDIO_DRIVE_RESET, nullptr);
        ::sleep(kComesBack);
        result |= ::ioctl(disk.Descriptor(), HDIO_SET_DMA, 1);
        return result;
    });
}
