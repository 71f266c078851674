// Switches IPv6 on an interface on or off.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/checkpoint.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

namespace {

int SwitchIpv6(const char *interface, bool on)
{
    const std::string file = tavo::InterfaceFile(interface);
    tavo::Checkpoint before;
    before.AddFile(file);
    before.AddIpv6(interface);
    before.Begin();
    // Quietly: the shell itself complains of an interface that is not there.
    const auto command =
        tavo::ShellCommand("/bin/echo %d > %s%s%s", on ? 0 : 1, "/proc/sys/net/ipv6/conf/", interface, "/disable_ipv6");
    if (!command || tavo::RunNetText(*command, true) != 0) {
        before.PutBackAll();  // it may have been killed when its work was done
        return Fail(ERR_OP_FAILURE);
    }
    const tavo::SettingChange changes[] = {{"DEVICE", interface}, {"IPV6INIT", on ? "yes" : "no"}};
    const int code = tavo::RewriteSettings(file, changes);
    before.End();
    if (code == 0)
        return 0;
    LogError("%s:%d Set %s error.", file);
    Fail(code);
    return -2;
}

}  // namespace

extern "C" int TAVONetIPv6Set(const char *szInterface, int fEnable)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] { return tavo::ChangeNetwork([&] { return SwitchIpv6(szInterface, fEnable != 0); }); });
}
