// The routes that must be there whatever happened to an interface.
#include "network/detail/connected_route.h"

#include "network/detail/dhcp_client.h"
#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_command.h"
#include "network/detail/route_change.h"

#include <algorithm>

#include <net/route.h>

namespace tavo {
namespace {

void RepairConnected(const std::vector<Route> &routes, const std::string &interface)
{
    const auto found = AddressOf(interface);
    if (!found)
        return;
    const uint32_t network = found->address.Word() & found->mask.Word();
    const bool present = std::any_of(routes.begin(), routes.end(), [&](const Route &route) {
        return route.interface == interface && route.destination.Word() == network &&
               route.mask.Word() == found->mask.Word();
    });
    if (!present)
        RunRouteTool("add", Ipv4Route{Ipv4::FromWord(network), found->mask}, interface.c_str());
}

void AddDefault(const Ipv4 &gateway)
{
    RunNetCommand("/sbin/route add default gw %s > /dev/null 2>&1", gateway.Text());
}

void RepairDefault(const std::vector<Route> &routes, const std::string &card, bool dhcp)
{
    const auto stored = ParseIpv4(ReadSetting(kNetworkFile, "GATEWAY"));
    if (dhcp) {
        const auto leased = ParseIpv4(ReadSetting(DhcpLeaseFile(card), "GATEWAY"));
        const auto gateway = leased ? leased : stored;
        if (gateway && std::none_of(routes.begin(), routes.end(), [](const Route &route) { return route.IsDefault(); }))
            AddDefault(*gateway);
        return;
    }
    const auto leads_there = [&](const Route &route) {
        return route.IsDefault() && route.gateway.Word() == stored->Word();
    };
    if (stored && std::none_of(routes.begin(), routes.end(), leads_there))
        AddDefault(*stored);
}

}  // namespace

std::vector<Route> LiveRoutes()
{
    const auto text = ReadKernelFile("/proc/net/route");
    return text ? ParseRouteTable(*text).value_or(std::vector<Route>()) : std::vector<Route>();
}

void RepairRoutes(const std::string &interface, bool dhcp)
{
    const std::vector<Route> routes = LiveRoutes();
    const std::vector<std::string> cards = WiredInterfaces();
    for (const std::string &card : cards)
        RepairConnected(routes, card);
    const std::string &first = cards.empty() ? interface : cards.front();
    RepairDefault(routes, first, first == interface ? dhcp : ReadSetting(InterfaceFile(first), "BOOTPROTO") == "dhcp");
}

void RepairRoutes()
{
    RepairRoutes("", false);
}

std::string RouteCommand(const Route &route)
{
    if (route.IsDefault() && route.metric == 0)
        return ShellCommand("/sbin/route add default gw %s > /dev/null 2>&1", route.gateway.Text()).value_or("");
    const std::string via = route.flags & RTF_GATEWAY ? " gw " + route.gateway.Text() : "";
    const std::string metric = route.metric != 0 ? " metric " + std::to_string(route.metric) : "";
    return ShellCommand("/sbin/route add -net %s netmask %s%s%s dev %s > /dev/null 2>&1", route.destination.Text(),
                        route.mask.Text(), ComposedPiece{via}, ComposedPiece{metric}, route.interface)
        .value_or("");
}

std::string RouteText(const Route &route)
{
    return route.interface + " " + route.destination.Text() + " " + route.mask.Text() + " " + route.gateway.Text() +
           " " + std::to_string(route.metric);
}

}  // namespace tavo
