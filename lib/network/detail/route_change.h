// Adding and removing routes: the refusals, and the tools that change them.
#ifndef TAVO_NETWORK_DETAIL_ROUTE_CHANGE_H
#define TAVO_NETWORK_DETAIL_ROUTE_CHANGE_H

#include "core/detail/where.h"
#include "network/detail/ipv4_text.h"
#include "network/detail/ipv6_text.h"

#include <optional>

namespace tavo {

struct Ipv4Route {
    Ipv4 network;
    Ipv4 mask;
};

struct Ipv6Route {
    in6_addr network;
    int length;
    std::optional<in6_addr> gateway;  // none: the network is on the link
};

// Empty when a text is not an address, the mask has holes or the network has bits outside of it.
std::optional<Ipv4Route> ParseRoute(const char *network, const char *mask) noexcept;
std::optional<Ipv6Route> ParseRoute(const char *network, int length, const char *gateway) noexcept;

// "/sbin/route VERB -net NETWORK netmask MASK dev INTERFACE"; its exit status, -1 when it was not run.
int RunRouteTool(const char *verb, const Ipv4Route &route, const char *interface);
// "/sbin/ip -6 route VERB NETWORK/LENGTH [via GATEWAY] dev INTERFACE".
int RunRouteTool(const char *verb, const Ipv6Route &route, const char *interface);

// The bodies of the exported functions, with what they refuse. A route is one step of the kernel's, and stored nowhere.
int ChangeIpv4Route(const char *verb, const char *network, const char *mask, const char *interface,
                    Where where = Where()) noexcept;
int ChangeIpv6Route(const char *verb, const char *interface, const char *network, int length, const char *gateway,
                    Where where = Where()) noexcept;

}  // namespace tavo

#endif
