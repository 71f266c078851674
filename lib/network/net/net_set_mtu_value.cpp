// Gives the kernel the MTU of an interface, and stores it for the next start.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/mtu_setting.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

namespace {

// One that the card refuses is not stored: the next start would fail on it, too.
int SetBoth(const char *interface, int mtu)
{
    const std::string before = tavo::InterfaceAttribute(interface, "mtu");
    if (TAVONetSetMTUEth(interface, mtu) != 0)
        return -1;
    if (TAVOConfSetMTUValue(interface, mtu) == 0)
        return 0;
    if (!before.empty())
        tavo::RunNetCommand("/sbin/ifconfig %s mtu %s > /dev/null 2>&1", interface, before);
    return -1;
}

}  // namespace

extern "C" int TAVONetSetMTUValue(const char *szInterface, int mtu)
{
    if (!tavo::IsMtu(mtu) || !szInterface || !tavo::IsInterfaceName(szInterface))
        return TAVOConfSetMTUValue(szInterface, mtu);  // refuses, and logs why
    return Guard([&] { return tavo::ChangeNetwork([&] { return SetBoth(szInterface, mtu); }, TAVO_LOCK_TAVOINFO); });
}
