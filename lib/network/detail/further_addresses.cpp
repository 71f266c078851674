// The IPv4 addresses that an interface has beside its first one, while the first one changes.
#include "network/detail/further_addresses.h"

#include "network/detail/connected_route.h"
#include "network/detail/live_card.h"
#include "network/detail/net_command.h"

#include <algorithm>

#include <net/route.h>

namespace tavo {
namespace {

void RunIp(const char *verb, const InterfaceAddress &one, const std::string &interface)
{
    RunNetCommand("/sbin/ip addr %s %s/%d dev %s > /dev/null 2>&1", verb, one.address.Text(),
                  PrefixLength(one.mask).value_or(32), interface);
}

}  // namespace

FurtherAddresses::FurtherAddresses(const std::string &interface) : interface_(interface)
{
    addresses_ = LiveAddresses(interface);
    if (!addresses_.empty())
        addresses_.erase(addresses_.begin());
    if (addresses_.empty())
        return;
    routes_ = LiveRoutes();
    std::erase_if(routes_, [&](const Route &route) {
        return route.interface != interface || !(route.flags & RTF_GATEWAY) ||
               std::none_of(addresses_.begin(), addresses_.end(), [&](const InterfaceAddress &one) {
                   return ((route.gateway.Word() ^ one.address.Word()) & one.mask.Word()) == 0;
               });
    });
    for (const InterfaceAddress &one : addresses_)
        RunIp("del", one, interface);
}

void FurtherAddresses::PutBack() const
{
    const auto first = AddressOf(interface_);
    for (const InterfaceAddress &one : addresses_) {
        if (!first || !(one.address == first->address))
            RunIp("add", one, interface_);
    }
    for (const Route &route : routes_)
        RunNetText(RouteCommand(route));
}

}  // namespace tavo
