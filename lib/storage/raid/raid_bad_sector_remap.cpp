// Switches the remapping of bad sectors.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/run_command.h"
#include "core/detail/shell_command.h"
#include "storage/detail/array_name.h"

extern "C" int RAIDBadSectorRemap(const char *szPath, int fEnable)
{
    if (!tavo::IsArrayPath(szPath)) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        const auto command = tavo::ShellCommand("sysctl -w kernel.tavo_raid_sync_flag=%d", fEnable ? 1 : 0);
        // Asked for at every scrub, and other kernels lack the switch: no line in the log each time.
        if (tavo::RunCommandQuietly(*command) == 0)
            return 0;
        LogDebug("%s:%d Failed to do '%s'", *command);
        return -1;
    });
}
