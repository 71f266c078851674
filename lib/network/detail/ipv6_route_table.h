// The kernel's IPv6 routes, as /proc/net/ipv6_route lists them.
#ifndef TAVO_NETWORK_DETAIL_IPV6_ROUTE_TABLE_H
#define TAVO_NETWORK_DETAIL_IPV6_ROUTE_TABLE_H

#include <string>
#include <string_view>
#include <vector>

namespace tavo {

struct LiveIpv6Route {
    std::string destination;  // "2001:db8::/32"
    std::string gateway;      // empty for a network on the link
};

// The routes of an interface, without those that come and go with an address or with the link itself. Rows that do not
// parse are left out.
std::vector<LiveIpv6Route> ParseIpv6RouteTable(std::string_view text, std::string_view interface);

}  // namespace tavo

#endif
