// Removes a route to an IPv6 network.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/lock_hold.h"
#include "core/detail/log.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv6_change.h"
#include "network/detail/network_lock.h"

extern "C" int TAVONetIPv6RouteDel(const char *szInterface, const char *szNet, int nPrefix, const char *szGateway)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || !szNet)
        return Fail(ERR_BAD_PARAMETERS);
    if (!tavo::IsPrefixLength(nPrefix)) {
        LogError("%s:%d Paramter Prefix length %d out of range [0, 128]", nPrefix);
        return Fail(ERR_INVALID_NETNAME);
    }
    const auto network = tavo::ParseIpv6(szNet);
    const auto gateway = szGateway ? tavo::ParseIpv6(szGateway) : std::nullopt;
    if (!network || !tavo::IsNetwork(*network, nPrefix) || (szGateway && (!gateway || !tavo::IsHostAddress(*gateway))))
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] {
        const tavo::LockHold lock(tavo::kNetworkExclusive, tavo::kNetworkSeconds);
        if (!lock)
            return Fail(ERR_LOCK_FAILED);
        const int status = tavo::RunRouteTool("del", *network, nPrefix, gateway, szInterface);
        return status == 0 ? 0 : Fail(ERR_OP_FAILURE);
    });
}
