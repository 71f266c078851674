// The routes that must be there whatever happened to an interface.
#include "network/detail/connected_route.h"

#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_command.h"
#include "network/detail/route_change.h"
#include "network/detail/route_table.h"

#include <algorithm>

namespace tavo {
namespace {

std::vector<Route> Routes()
{
    const auto text = ReadKernelFile("/proc/net/route");
    return text ? ParseRouteTable(*text).value_or(std::vector<Route>()) : std::vector<Route>();
}

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

}  // namespace

void RepairRoutes()
{
    const std::vector<Route> routes = Routes();
    for (const std::string &interface : WiredInterfaces())
        RepairConnected(routes, interface);

    const auto stored = ParseIpv4(ReadSetting(kNetworkFile, "GATEWAY"));
    if (!stored)
        return;
    const bool present = std::any_of(routes.begin(), routes.end(), [&](const Route &route) {
        return route.IsDefault() && route.gateway.Word() == stored->Word();
    });
    if (!present)
        RunNetCommand("/sbin/route add default gw %s > /dev/null 2>&1", stored->Text());
}

}  // namespace tavo
