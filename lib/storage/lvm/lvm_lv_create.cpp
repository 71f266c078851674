// Makes the logical volume that fills a group.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/partition_command.h"
#include "storage/detail/volume_name.h"

#include <cerrno>
#include <cstring>

#include <sys/stat.h>

extern "C" int LVMLvCreate(const char *szVg, const char *szLv)
{
    if (!szVg || !szLv || !tavo::IsGroupPath(szVg) || !tavo::IsVolumeName(szLv)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        auto result = tavo::RunDiskCommand("/sbin/lvcreate %s -n %s -l100%%VG > /dev/null 2>&1", szVg, szLv);
        // Where the volume goes an earlier one may have been: then lvcreate asks whether to wipe the file system that it
        // finds. Only free extents of the group are taken, so nothing in use can be meant.
        if (result.status != 0)
            result = tavo::RunDiskCommand("/sbin/lvcreate -y %s -n %s -l100%%VG > /dev/null 2>&1", szVg, szLv);
        if (result.status != 0) {
            LogError("%s:%d Failed to '%s'", result.command);
            return -1;
        }
        constexpr mode_t mode = 0755;
        if (::chmod(szVg, mode) != 0)
            LogError("%s:%d Failed to chmod '%s' to '%X', errno=%s", szVg, mode, std::strerror(errno));
        return 0;
    });
}
