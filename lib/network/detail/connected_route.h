// The routes that must be there whatever happened to an interface.
#ifndef TAVO_NETWORK_DETAIL_CONNECTED_ROUTE_H
#define TAVO_NETWORK_DETAIL_CONNECTED_ROUTE_H

namespace tavo {

// Adds what is missing: the connected network of each interface with an address, and the stored default gateway.
void RepairRoutes();

}  // namespace tavo

#endif
