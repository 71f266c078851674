// Reads the size of a disk or partition in sectors.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/disk_size.h"

#include <cstring>

extern "C" int DiskSizeGet(const char *szPath, uint64_t *pcSector)
{
    if (!szPath || !pcSector)
        return Fail(ERR_BAD_PARAMETERS);
    const tavo::Fd disk = tavo::OpenFd(szPath, O_RDONLY);
    if (!disk && errno == ENXIO)
        return 0;
    if (!disk) {
        LogError("%s:%d Failed to open %s, errno=%s", szPath, std::strerror(errno));
        return -1;
    }
    uint64_t bytes = 0;
    if (!tavo::AskSize(disk, bytes)) {
        LogError("%s:%d Failed to ioctl %s, errno=%s", szPath, std::strerror(errno));
        return -1;
    }
    *pcSector = bytes / tavo::kSectorSize;
    return 1;
}
