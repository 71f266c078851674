// Adds a route to an IPv6 network.
#include "tavo_net.h"

#include "network/detail/route_change.h"

extern "C" int TAVONetIPv6RouteAdd(const char *szInterface, const char *szNet, int nPrefix, const char *szGateway)
{
    return tavo::ChangeIpv6Route("add", szInterface, szNet, nPrefix, szGateway);
}
