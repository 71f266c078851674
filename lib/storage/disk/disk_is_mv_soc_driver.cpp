// Checks whether a disk's controller takes no raw ATA commands.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/raw_disk.h"

#include <cstring>

extern "C" int TAVODiskIsMvSocDriver(const char *szPath)
{
    if (!szPath || !tavo::IsDeviceName(tavo::LastPart(szPath)))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        std::string unreadable;
        const int result = tavo::HangsOnMarvell(szPath, unreadable);
        if (result < 0)
            tavo::LogBare("readlink() from %s failed. (%s)", unreadable, std::strerror(errno));
        return result;
    });
}
