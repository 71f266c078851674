// The network as its files have it and as the kernel has it, as documents.
#ifndef TAVOCTL_NET_PRESENT_H
#define TAVOCTL_NET_PRESENT_H

#include "network/net_document.h"

namespace tavoctl {

// The settings in "/etc/sysconfig/network-scripts/more-NAME", beside the interface file.
struct MoreFile {
    std::vector<std::string> addresses;  // of both families, with their lengths
    std::string ipv6_gateway;            // "" for none
    std::vector<std::string> routes;     // as in a document
    std::string parent;                  // of a VLAN
    int vlan = 0;

    bool operator==(const MoreFile &) const = default;
    std::string Text() const;
};

inline constexpr char net_folder[] = "/etc/sysconfig/network-scripts/";
inline constexpr char network_file[] = "/etc/sysconfig/network";
inline constexpr char search_file[] = "/etc/sysconfig/network-scripts/search";
inline constexpr char resolver_file[] = "/etc/resolv.conf";

MoreFile ReadMoreFile(const std::string &interface);

std::string NetSetting(const std::string &path, const std::string &key);
std::string InterfaceFileOf(const std::string &interface);

// Complete: with every fact that there is, and the empty ones.
NetDocument StoredNet();
// Facts that only files have, or that a lease or a router decides, are missing.
NetDocument LiveNet(const NetDocument &stored);

// The facts of one interface in the kernel. `mode` decides whether the first address counts.
NetFactsMap LiveCard(const std::string &interface, const std::string &mode);

}  // namespace tavoctl

#endif
