// The IPv4 addresses that an interface has beside its first one, while the first one changes.
#ifndef TAVO_NETWORK_DETAIL_FURTHER_ADDRESSES_H
#define TAVO_NETWORK_DETAIL_FURTHER_ADDRESSES_H

#include "network/detail/kernel_interface.h"
#include "network/detail/route_table.h"

#include <string>
#include <vector>

namespace tavo {

class FurtherAddresses {
  public:
    // Takes them away: the kernel would give the mask that ifconfig sets to one of them, and leave the new address without.
    // Runs nothing for an interface with one address.
    explicit FurtherAddresses(const std::string &interface);

    // Adds them again, and the routes through routers on their networks.
    void PutBack() const;

  private:
    std::string interface_;
    std::vector<InterfaceAddress> addresses_;
    std::vector<Route> routes_;
};

}  // namespace tavo

#endif
