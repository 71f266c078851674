// Routes that are added and removed.
#include "network/detail/route_change.h"

#include "network/detail/net_command.h"

namespace tavo {

std::optional<Ipv4Route> ParseRoute(const char *network, const char *mask) noexcept
{
    const auto net = ParseIpv4(network);
    const auto bits = ParseIpv4(mask);
    if (!net || !bits || !PrefixLength(*bits) || (net->Word() & ~bits->Word()) != 0)
        return std::nullopt;
    return Ipv4Route{*net, *bits};
}

std::optional<Ipv6Route> ParseRoute(const char *network, int length, const char *gateway) noexcept
{
    const auto net = ParseIpv6(network);
    const auto via = gateway ? ParseIpv6(gateway) : std::nullopt;
    if (!net || !IsNetwork(*net, length) || (gateway && (!via || !IsHostAddress(*via))))
        return std::nullopt;
    return Ipv6Route{*net, length, via};
}

int RunRouteTool(const char *verb, const Ipv4Route &route, const char *interface)
{
    return RunNetCommand("/sbin/route %s -net %s netmask %s dev %s > /dev/null 2>&1", verb, route.network.Text(),
                         route.mask.Text(), interface);
}

int RunRouteTool(const char *verb, const Ipv6Route &route, const char *interface)
{
    const std::string network = Ipv6Text(route.network);
    if (route.gateway)
        return RunNetCommand("/sbin/ip -6 route %s %s/%d via %s dev %s > /dev/null 2>&1", verb, network, route.length,
                             Ipv6Text(*route.gateway), interface);
    return RunNetCommand("/sbin/ip -6 route %s %s/%d dev %s > /dev/null 2>&1", verb, network, route.length, interface);
}

}  // namespace tavo
