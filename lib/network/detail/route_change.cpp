// Routes that are added and removed.
#include "network/detail/route_change.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv6_change.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

namespace tavo {
namespace {

template <class Route>
int ChangeRoute(const char *verb, const std::optional<Route> &route, const char *interface, Where where) noexcept
{
    if (!route)
        return Fail(ERR_INVALID_NETNAME, where);
    const auto change = [&] {
        return RunRouteTool(verb, *route, interface) == 0 ? 0 : Fail(ERR_OP_FAILURE, where);
    };
    return Guard([&] { return ChangeNetwork(change, 0, where); }, ERR_OUT_OF_MEMORY, where);
}

}  // namespace

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

int ChangeIpv4Route(const char *verb, const char *network, const char *mask, const char *interface,
                    Where where) noexcept
{
    if (!network || !mask || !interface || !IsInterfaceName(interface))
        return Fail(ERR_BAD_PARAMETERS, where);
    return ChangeRoute(verb, ParseRoute(network, mask), interface, where);
}

int ChangeIpv6Route(const char *verb, const char *interface, const char *network, int length, const char *gateway,
                    Where where) noexcept
{
    if (!interface || !IsInterfaceName(interface) || !network)
        return Fail(ERR_BAD_PARAMETERS, where);
    if (!IsPrefixLength(length)) {
        LogErrorAt(where, "%s:%d Paramter Prefix length %d out of range [0, 128]", length);
        return Fail(ERR_INVALID_NETNAME, where);
    }
    return ChangeRoute(verb, ParseRoute(network, length, gateway), interface, where);
}

}  // namespace tavo
