// Removes a route to an IPv6 network.
#include "tavo_net.h"

#include "network/detail/route_change.h"

extern "C" int TAVONetIPv6RouteDel(const char *szInterface, const char *szNet, int nPrefix, const char *szGateway)
{
    return tavo::ChangeIpv6Route("del", szInterface, szNet, nPrefix, szGateway);
}
