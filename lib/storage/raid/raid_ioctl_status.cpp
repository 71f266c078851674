// Asks the appliance's driver for the health of an array.
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/array_members.h"

#include <cerrno>
#include <cstring>

extern "C" int RAIDIoctlStatus(int fd, int *pStatus)
{
    if (fd < 0 || !pStatus)
        return Fail(ERR_BAD_PARAMETERS);
    int status = -1;
    if (::ioctl(fd, tavo::kStatusRequest, &status) != 0) {
        if (errno == ENODEV)
            return Fail(ERR_PATH_NOT_FOUND);
        LogError("%s:%d Failed to ioctl for raid status, errno=%s", std::strerror(errno));
        return Fail(ERR_UNKNOWN);
    }
    if (status < 0 || status > 2) {
        LogDebug("%s:%d unknown raid status, status=%d", status);
        return Fail(ERR_UNKNOWN);
    }
    *pStatus = status + RAID_STATUS_NORMAL;
    return 0;
}
