// The kernel's state of the network interfaces: /sys/class/net and the interface requests of a socket.
#ifndef TAVO_NETWORK_DETAIL_KERNEL_INTERFACE_H
#define TAVO_NETWORK_DETAIL_KERNEL_INTERFACE_H

#include "network/detail/ipv4_text.h"

#include <optional>
#include <string>
#include <vector>

namespace tavo {

// The wired interfaces that can have an address: Ethernet devices and bonds, without the members of a bond, in the
// natural order of their names (eth2 before eth10). Empty when one of them cannot be read.
std::optional<std::vector<std::string>> WiredInterfaces();

// The text of /sys/class/net/INTERFACE/ATTRIBUTE without its newline; empty when it cannot be read.
std::string InterfaceAttribute(const std::string &interface, const char *attribute);

struct InterfaceAddress {
    Ipv4 address;
    Ipv4 mask;
};

// Empty with errno: EADDRNOTAVAIL for an interface without an IPv4 address.
std::optional<InterfaceAddress> AddressOf(const std::string &interface);

// The whole text of a small kernel file; empty when it cannot be opened, with errno.
std::optional<std::string> ReadKernelFile(const char *path);

}  // namespace tavo

#endif
