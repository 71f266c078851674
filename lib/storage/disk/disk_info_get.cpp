// Reads what there is to know about a disk.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/owner.h"
#include "storage/detail/disk_path.h"
#include "storage/detail/disk_size.h"

#include <cstring>

extern "C" int DiskInfoGet(const char *szPath, DISKINFO **ppInfo)
{
    if (!szPath || !ppInfo)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::HeapBlock<DISKINFO> info(static_cast<DISKINFO *>(std::calloc(1, sizeof(DISKINFO))));
        if (!info)
            return Fail(ERR_OUT_OF_MEMORY);
        DISKPATH path;
        if (DiskPathParse(szPath, &path) != 0) {
            LogError("%s:%d Failed to parse disk path: %s", szPath);
            return -1;
        }
        info->iDisk = path.iDisk;
        info->nNameKind = path.nNameKind;
        info->iUnit = path.iUnit;
        info->nPartition = path.nPartition;
        const std::string device = tavo::DiskDevice(path);
        std::strcpy(info->szPath, device.c_str());  // "/dev/sd" and two letters at most

        const tavo::Fd disk = tavo::OpenFd(info->szPath, O_RDONLY);
        if (!disk && errno == ENXIO)
            return 0;
        if (!disk) {
            LogError("%s:%d Failed to open %s, errno=%s", info->szPath, std::strerror(errno));
            return -1;
        }
        uint64_t bytes = 0;
        if (!tavo::AskSize(disk, bytes)) {
            LogError("%s:%d Failed to ioctl %s, errno=%s", info->szPath, std::strerror(errno));
            return -1;
        }
        TAVOLnxDiskGetModel(info->szPath, info->szModel, sizeof info->szModel);
        info->cbDisk = bytes - bytes % tavo::kSectorSize;
        info->nTemperature = TAVODiskTemperatureGet(info->szPath);
        *ppInfo = info.Release();
        return 1;
    });
}
