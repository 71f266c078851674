// The texts of a document of the network: each gives its one form, or nothing when it is not valid.
#ifndef TAVOCTL_NET_TEXT_H
#define TAVOCTL_NET_TEXT_H

#include <cstdint>
#include <optional>
#include <string>

namespace tavoctl {

using NormalText = std::optional<std::string>;

NormalText NormalHostname(const std::string &text);
NormalText NormalIpv4(const std::string &text);      // of a host
NormalText NormalIpv4Card(const std::string &text);  // "192.0.2.10/24", neither the network nor its broadcast
NormalText NormalIpv6(const std::string &text);
NormalText NormalIpv6Card(const std::string &text);  // "2001:db8::1/64"
NormalText NormalServer(const std::string &text);    // IPv4 or IPv6
NormalText NormalDomain(const std::string &text);
NormalText NormalRoute(const std::string &text);  // "198.51.100.0/24 via 192.0.2.1"
NormalText NormalInterface(const std::string &text);
NormalText NormalBondMode(const std::string &text);
NormalText NormalCardMode(const std::string &text);

// An address of either family, with the length of its network: "192.0.2.10/24".
struct IpAddress {
    int family = 0;
    unsigned length = 0;      // in bits; all where the text had none
    bool has_length = false;  // the text had one
    uint8_t bytes[16] = {};   // of IPv4 the first four

    static std::optional<IpAddress> In(const std::string &text);
    std::string Plain() const;
    std::string Text() const;             // with the length
    IpAddress WithHost(bool ones) const;  // the network itself, or its broadcast address
    bool HostIs(bool ones) const;
};

// "192.0.2.10" of "192.0.2.10/24".
std::string PlainAddress(const std::string &address);

// "192.0.2.0/24" of "192.0.2.10/24"; "" for another text.
std::string NetworkOf(const std::string &card_address);

// "255.255.255.0" of "192.0.2.10/24".
std::string MaskOf(const std::string &card_address);

// The length of a mask such as 255.255.255.0.
int LengthOfMask(const std::string &mask);

// Returns whether the address belongs to the network of "192.0.2.10/24".
bool IsInNetwork(const std::string &address, const std::string &card_address);

}  // namespace tavoctl

#endif
