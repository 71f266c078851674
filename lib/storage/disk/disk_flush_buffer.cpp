// Writes everything that the kernel and the drive hold for a disk.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/raw_disk_report.h"

#include <linux/fs.h>
#include <sys/ioctl.h>
#include <unistd.h>

extern "C" int TAVOIDiskFlushBuffer(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::WithRawDisk(szPath, [&](const tavo::RawDisk &disk) {
        const int fd = disk.Descriptor();
        ::sync();
        const bool synced = ::fsync(fd) == 0;
        const bool data_synced = ::fdatasync(fd) == 0;
        ::sync();
        if (::ioctl(fd, BLKFLSBUF, nullptr) != 0) {
            LogError("%s:%d ioctl(fd, BLKFLSBUF, NULL) fail");
            return -1;
        }
        ::sync();
        const int result = disk.Command(DISK_COMMAND_FLUSH, nullptr);
        ::sync();
        return synced && data_synced ? result : -1;
    });
}
