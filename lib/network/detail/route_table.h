// The kernel's IPv4 routes, as /proc/net/route lists them.
#ifndef TAVO_NETWORK_DETAIL_ROUTE_TABLE_H
#define TAVO_NETWORK_DETAIL_ROUTE_TABLE_H

#include "network/detail/ipv4_text.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tavo {

struct Route {
    std::string interface;
    Ipv4 destination;
    Ipv4 gateway;
    Ipv4 mask;
    uint32_t flags = 0;   // RTF_ bits of <net/route.h>
    uint32_t metric = 0;  // the route with the least one is used

    bool IsDefault() const noexcept;
};

// Empty when the header line is not the one that this format has; rows that do not parse are left out.
std::optional<std::vector<Route>> ParseRouteTable(std::string_view text);

}  // namespace tavo

#endif
