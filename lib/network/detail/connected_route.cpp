// The routes that must be there whatever happened to an interface.
#include "network/detail/connected_route.h"

#include "network/detail/dhcp_client.h"
#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_command.h"
#include "network/detail/route_change.h"

#include <algorithm>
#include <cerrno>

#include <net/route.h>

namespace tavo {
namespace {

// Each of these is false when a look or a command failed that may well succeed the next time. A gateway on no network
// of ours is refused each time.
bool RepairConnected(const std::vector<Route> &routes, const std::string &interface)
{
    const auto found = AddressOf(interface);
    if (!found)
        return errno == EADDRNOTAVAIL;
    const uint32_t network = found->address.Word() & found->mask.Word();
    const bool present = std::any_of(routes.begin(), routes.end(), [&](const Route &route) {
        return route.interface == interface && route.destination.Word() == network && route.mask == found->mask;
    });
    return present || RunRouteTool("add", Ipv4Route{Ipv4::FromWord(network), found->mask}, interface.c_str()) != -1;
}

bool AddDefault(const Ipv4 &gateway, const std::string &card)
{
    const int status = RunNetCommand("/sbin/route add default gw %s > /dev/null 2>&1", gateway.Text());
    if (status <= 0)
        return status == 0;
    const auto own = AddressOf(card);
    return !own || ((own->address.Word() ^ gateway.Word()) & own->mask.Word()) != 0;
}

bool RepairDefault(const std::vector<Route> &routes, const std::string &card, bool dhcp)
{
    const auto setting = TryReadSetting(kNetworkFile, "GATEWAY");
    if (!setting)
        return false;
    const auto stored = ParseIpv4(*setting);
    if (dhcp) {
        const auto leased = ParseIpv4(ReadSetting(DhcpLeaseFile(card), "GATEWAY"));
        const auto gateway = leased ? leased : stored;
        const bool there =
            std::any_of(routes.begin(), routes.end(), [](const Route &route) { return route.IsDefault(); });
        return there || !gateway || AddDefault(*gateway, card);
    }
    const auto leads_there = [&](const Route &route) {
        return route.IsDefault() && route.gateway == *stored;
    };
    return !stored || std::any_of(routes.begin(), routes.end(), leads_there) || AddDefault(*stored, card);
}

bool TryRepair(const std::string &interface, bool dhcp)
{
    const auto text = ReadKernelFile("/proc/net/route");
    if (!text)
        return false;
    const auto routes = ParseRouteTable(*text).value_or(std::vector<Route>());
    const auto wired = WiredInterfaces();
    if (!wired)
        return false;
    const std::vector<std::string> &cards = *wired;
    bool done = true;
    for (const std::string &card : cards)
        done = RepairConnected(routes, card) && done;
    const std::string &first = cards.empty() ? interface : cards.front();
    const auto mode = first == interface ? std::optional<std::string>(dhcp ? "dhcp" : "static")
                                         : TryReadSetting(InterfaceFile(first), "BOOTPROTO");
    return mode && RepairDefault(routes, first, *mode == "dhcp") && done;
}

}  // namespace

std::vector<Route> LiveRoutes()
{
    const auto text = ReadKernelFile("/proc/net/route");
    return text ? ParseRouteTable(*text).value_or(std::vector<Route>()) : std::vector<Route>();
}

void RepairRoutes(const std::string &interface, bool dhcp)
{
    // Without its default route the appliance is cut off from its administrator, so a temporary failure must not remove
    // it.
    if (!TryRepair(interface, dhcp))
        TryRepair(interface, dhcp);
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
