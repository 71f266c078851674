// Removes a route to a network through an interface.
#include "tavo_net.h"

#include "network/detail/route_change.h"

extern "C" int TAVONetRouteDel(const char *szNet, const char *szMask, const char *szInterface)
{
    return tavo::ChangeIpv4Route("del", szNet, szMask, szInterface);
}
