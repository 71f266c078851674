// Removes a route to a network behind an interface.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/interface_name.h"
#include "network/detail/network_change.h"
#include "network/detail/route_change.h"

extern "C" int TAVONetRouteDel(const char *szNet, const char *szMask, const char *szInterface)
{
    if (!szNet || !szMask || !szInterface || !tavo::IsInterfaceName(szInterface))
        return Fail(ERR_BAD_PARAMETERS);
    const auto route = tavo::ParseRoute(szNet, szMask);
    if (!route)
        return Fail(ERR_INVALID_NETNAME);
    return Guard([&] {
        return tavo::ChangeNetwork(
            [&] { return tavo::RunRouteTool("del", *route, szInterface) == 0 ? 0 : Fail(ERR_OP_FAILURE); });
    });
}
