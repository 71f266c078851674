// Removes the logical volumes of a group.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/partition_command.h"
#include "storage/detail/volume_name.h"

#include <cstring>

extern "C" int LVMRemove(const char *szVg, const char *szKind)
{
    if (!szVg || !szKind || std::strcmp(szKind, "lv") != 0 || !tavo::IsGroupPath(szVg)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        const auto result = tavo::RunDiskCommand("/sbin/lvremove -f %s > /dev/null 2>&1", szVg);
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to '%s'", result.command);
        return -1;
    });
}
