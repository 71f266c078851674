// Renames a volume group.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/partition_command.h"
#include "storage/detail/volume_name.h"

extern "C" int LVMVgRename(const char *szVg, const char *szOldName, const char *szNewName)
{
    const char *const old = szVg ? szVg : szOldName;
    const bool good =
        old && szNewName && tavo::IsVolumeName(szNewName) && (szVg ? tavo::IsGroupPath(szVg) : tavo::IsVolumeName(old));
    if (!good) {
        LogError("%s:%d BAD_PARAMETERS");
        return -1;
    }
    return Guard([&] {
        const auto result = tavo::RunDiskCommand("/sbin/lvm vgrename %s %s > /dev/null 2>&1", old, szNewName);
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to '%s'", result.command);
        return -1;
    });
}
