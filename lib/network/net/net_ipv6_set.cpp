// Switches IPv6 on an interface on or off.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

extern "C" int TAVONetIPv6Set(const char *szInterface, int fEnable)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        return tavo::ChangeNetwork([&] {
            // Quietly: the shell itself complains of an interface that is not there.
            const auto command = tavo::ShellCommand("/bin/echo %d > %s%s%s", fEnable ? 0 : 1,
                                                    "/proc/sys/net/ipv6/conf/", szInterface, "/disable_ipv6");
            if (!command || tavo::RunCommandQuietly(*command) != 0)
                return Fail(ERR_OP_FAILURE);
            const tavo::SettingChange changes[] = {{"DEVICE", szInterface}, {"IPV6INIT", fEnable ? "yes" : "no"}};
            if (const int code = tavo::RewriteSettings(tavo::InterfaceFile(szInterface), changes)) {
                LogError("%s:%d Set %s error.", tavo::InterfaceFile(szInterface));
                Fail(code);
                return -2;
            }
            return 0;
        });
    });
}
