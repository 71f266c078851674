// Adds a route to an IPv6 network.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv6_change.h"
#include "network/detail/network_change.h"
#include "network/detail/route_change.h"

extern "C" int TAVONetIPv6RouteAdd(const char *szInterface, const char *szNet, int nPrefix, const char *szGateway)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || !szNet)
        return Fail(ERR_BAD_PARAMETERS);
    if (!tavo::IsPrefixLength(nPrefix)) {
        LogError("%s:%d Paramter Prefix length %d out of range [0, 128]", nPrefix);
        return Fail(ERR_INVALID_NETNAME);
    }
    const auto route = tavo::ParseRoute(szNet, nPrefix, szGateway);
    if (!route)
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] {
        return tavo::ChangeNetwork(
            [&] { return tavo::RunRouteTool("add", *route, szInterface) == 0 ? 0 : Fail(ERR_OP_FAILURE); });
    });
}
