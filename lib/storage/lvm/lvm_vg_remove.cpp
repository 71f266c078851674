// Removes a volume group.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/partition_command.h"
#include "storage/detail/volume_name.h"

extern "C" int LVMVgRemove(const char *szVg)
{
    // A path that passes this check is removed with everything below it.
    if (!szVg || !tavo::IsGroupPath(szVg)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        if (tavo::RunDiskCommand("/sbin/vgremove %s > /dev/null 2>&1", szVg).status != 0) {
            LogError("%s:%d Failed to vgremove '%s'", szVg);
            return -1;
        }
        if (tavo::RunDiskCommand("/bin/rm -rf %s > /dev/null 2>&1", szVg).status != 0) {
            LogError("%s:%d Failed to rm -rf '%s'", szVg);
            return -1;
        }
        return 0;
    });
}
