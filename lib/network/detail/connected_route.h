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

// Adds the routes of the interface that `before` has and `now` has not, except the one to its own network.
void PutBackRoutes(const std::vector<Route> &before, const std::vector<Route> &now, const std::string &interface);

}  // namespace tavo

#endif
