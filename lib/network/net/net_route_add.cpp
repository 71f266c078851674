// Adds a route to a network behind an interface.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/lock_hold.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv4_text.h"
#include "network/detail/net_command.h"
#include "network/detail/network_lock.h"

extern "C" int TAVONetRouteAdd(const char *szNet, const char *szMask, const char *szInterface)
{
    if (!szNet || !szMask || !szInterface || !tavo::IsInterfaceName(szInterface))
        return Fail(ERR_BAD_PARAMETERS);
    const auto net = tavo::ParseIpv4(szNet);
    const auto mask = tavo::ParseIpv4(szMask);
    if (!net || !mask || !tavo::PrefixLength(*mask) || (net->Word() & ~mask->Word()) != 0)
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] {
        const tavo::LockHold lock(tavo::kNetworkExclusive, tavo::kNetworkSeconds);
        if (!lock)
            return Fail(ERR_LOCK_FAILED);
        const int status = tavo::RunNetCommand("/sbin/route add -net %s netmask %s dev %s > /dev/null 2>&1",
                                               net->Text(), mask->Text(), szInterface);
        return status == 0 ? 0 : Fail(ERR_OP_FAILURE);
    });
}
