// Finds the logical volume on a device.
#include "tavo_lvm.h"

#include "core/detail/command_output.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/shell_command.h"
#include "storage/detail/device_name.h"
#include "storage/detail/lvm_line.h"

#include <cstring>

extern "C" int LVMGetLVPath(const char *szDevice, char *szPath, int cbPath)
{
    if (!szPath || cbPath < 1 || !szDevice || !tavo::IsDevicePath(szDevice)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        const std::string command = *tavo::ShellCommand(
            "pvs -o pv_name,vg_name,lv_name,origin --noheading --separator %c | grep %s", ":", szDevice);
        tavo::CommandOutput output(command);
        for (std::string line; output.Next(line);) {
            const auto found = tavo::ParsePvVolumeLine(line);
            if (!found) {
                LogError("%s:%d Unexpected line '%s' of '%s'", line, command);
                continue;
            }
            if (found->device != szDevice)  // grep finds /dev/md10 for /dev/md1 too
                continue;
            const std::string path = std::string(tavo::kDev).append(found->group).append("/").append(found->volume);
            if (path.size() >= static_cast<size_t>(cbPath))
                return Fail(ERR_NOT_ENOUGH_MEMORY);
            std::memcpy(szPath, path.c_str(), path.size() + 1);
            return 1;
        }
        return 0;
    });
}
