// Reads a physical volume.
#include "tavo_lvm.h"

#include "core/detail/command_output.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/shell_command.h"
#include "storage/detail/device_name.h"

extern "C" int LVMPvSBGet(const char *szDevice, LVMPV *pPv)
{
    if (!pPv || !szDevice || !tavo::IsDevicePath(szDevice)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    if (LVMIsSupport() != 1)
        return 0;
    return Guard([&] {
        const std::string command = *tavo::ShellCommand("/sbin/pvs --noheading -o pv_name,vg_name,vg_uuid,pv_count "
                                                        "--separator \"|\" %s 2>/dev/null",
                                                        szDevice);
        tavo::CommandOutput output(command);
        for (std::string line; output.Next(line);) {
            if (LVMPvParseLine(line.c_str(), pPv) == 0)
                return 1;
        }
        if (output.Status() >= 0)
            return 0;
        LogError("%s:%d Failed to do '%s'", command);
        return -1;
    });
}
