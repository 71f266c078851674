// Changes of IPv6 addresses and routes.
#include "network/detail/ipv6_change.h"

#include "network/detail/net_command.h"

namespace tavo {

int RunAddressTool(const char *verb, const in6_addr &address, int length, const char *interface)
{
    return RunNetCommand("/sbin/ip -6 addr %s %s/%d dev %s > /dev/null 2>&1", verb, Ipv6Text(address), length,
                         interface);
}

int RunRouteTool(const char *verb, const in6_addr &network, int length, const std::optional<in6_addr> &gateway,
                 const char *interface)
{
    if (gateway)
        return RunNetCommand("/sbin/ip -6 route %s %s/%d via %s dev %s > /dev/null 2>&1", verb, Ipv6Text(network),
                             length, Ipv6Text(*gateway), interface);
    return RunNetCommand("/sbin/ip -6 route %s %s/%d dev %s > /dev/null 2>&1", verb, Ipv6Text(network), length,
                         interface);
}

}  // namespace tavo
