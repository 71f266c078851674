// Sets the MTU of an interface in the kernel.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_name.h"
#include "network/detail/mtu_setting.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

extern "C" int TAVONetSetMTUEth(const char *szInterface, int mtu)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || !tavo::IsMtu(mtu))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        return tavo::ChangeNetwork([&] {
            if (tavo::RunNetCommand("/sbin/ifconfig %s mtu %d > /dev/null 2>&1", szInterface, mtu) == 0)
                return 0;
            const int failed = Fail(ERR_OP_FAILURE);
            LogError("%s:%d Failed to ifconfig MTU Value(0x%04X)", TLIBErrGet());
            return failed;
        });
    });
}
