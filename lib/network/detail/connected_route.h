// The routes that must be there whatever happened to an interface.
#ifndef TAVO_NETWORK_DETAIL_CONNECTED_ROUTE_H
#define TAVO_NETWORK_DETAIL_CONNECTED_ROUTE_H

#include "network/detail/route_table.h"

#include <string>
#include <vector>

namespace tavo {

// The kernel's routes; none when its table cannot be read.
std::vector<Route> LiveRoutes();

// Adds missing routes: the connected network of each interface with an address, and the default route. The stored
// gateway is that of a first card with a static address. With DHCP the one of the lease counts; the stored one helps out
// where there is no default route and the lease names none. `dhcp` is the mode of `interface`, whatever its file says.
void RepairRoutes(const std::string &interface, bool dhcp);

// The same with every mode as the files have it.
void RepairRoutes();

// "/sbin/route add ..." of a route as the kernel has it.
std::string RouteCommand(const Route &route);

// All of a route on one line, to compare it.
std::string RouteText(const Route &route);

}  // namespace tavo

#endif
