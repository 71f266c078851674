// Reads a volume group.
#include "tavo_lvm.h"

#include "core/detail/command_output.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/shell_command.h"
#include "storage/detail/bounded_text.h"
#include "storage/detail/lvm_line.h"

extern "C" int LVMVgSBGet(const char *szVg, LVMVG *pVg)
{
    if (!pVg || !szVg || !tavo::IsGroupPath(szVg)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    if (LVMIsSupport() != 1)
        return 0;
    return Guard([&] {
        const std::string command = *tavo::ShellCommand("/sbin/vgs --noheading -o vg_uuid %s 2>/dev/null", szVg);
        tavo::CommandOutput output(command);
        for (std::string line; output.Next(line);) {
            const auto uuid = tavo::ParseVgLine(line);
            if (!uuid)
                continue;
            *pVg = {};
            tavo::CopyBounded(pVg->szVg, szVg);
            tavo::CopyBounded(pVg->szUuid, *uuid);
            return 1;
        }
        if (output.Status() >= 0)
            return 0;
        LogError("%s:%d Failed to do '%s'", command);
        return -1;
    });
}
