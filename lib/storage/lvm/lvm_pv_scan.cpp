// Has the system look for physical volumes.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/partition_command.h"

extern "C" int LVMPvScan(void)
{
    return Guard([] {
        const auto result = tavo::RunDiskCommand("/sbin/pvscan > /dev/null 2>&1");
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to '%s'", result.command);
        return -1;
    });
}
