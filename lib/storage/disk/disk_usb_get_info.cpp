// Reads the size of a device by its kernel name.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "storage/detail/device_name.h"
#include "storage/detail/disk_size.h"

#include <string>

extern "C" int TAVODiskUSBGetInfo(const char *szName, uint64_t *pcMib)
{
    if (!szName || !pcMib || !tavo::IsDeviceName(szName))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const tavo::Fd disk = tavo::OpenFd((std::string(tavo::kDev) + szName).c_str(), O_RDONLY);
        uint64_t bytes = 0;
        if (!disk || !tavo::AskSize(disk, bytes))
            return Fail(ERR_DISK_IO_FAILED);
        *pcMib = bytes >> 20;
        return 0;
    });
}
