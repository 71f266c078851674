// What the kernel has for one interface: link state, addresses and routes of both families, wake-on-LAN.
#ifndef TAVO_NETWORK_DETAIL_LIVE_CARD_H
#define TAVO_NETWORK_DETAIL_LIVE_CARD_H

#include "network/detail/ipv6_route_table.h"
#include "network/detail/kernel_interface.h"

#include <string>
#include <vector>

namespace tavo {

bool IsUp(const std::string &interface);

// All IPv4 addresses, the first one first.
std::vector<InterfaceAddress> LiveAddresses(const std::string &interface);

// "ADDRESS/LENGTH" of each.
std::vector<std::string> LiveIpv6Addresses(const std::string &interface);

std::vector<LiveIpv6Route> LiveIpv6Routes(const std::string &interface);

// The file that switches IPv6 of the interface: "1" is off.
std::string Ipv6Switch(const std::string &interface);

// The packets on which the card wakes the appliance, a number of WAKE_ bits; empty where the model or the card cannot, or
// the front panel does it.
std::string LiveWakeBits(const std::string &interface);

// All of it, and whether a DHCP client takes care of the interface, as one comparable text.
std::string LiveCardText(const std::string &interface);

}  // namespace tavo

#endif
