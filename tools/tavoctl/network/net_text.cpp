// The texts of a document of the network.
#include "network/net_text.h"

#include "tavo_net.h"

#include "frame/text.h"

#include <algorithm>
#include <bit>
#include <cstring>

#include <arpa/inet.h>
#include <net/if.h>

namespace tavoctl {
namespace {

struct Halves {
    std::string before, after;
};

std::optional<Halves> Split(const std::string &text, const char *at)
{
    const std::size_t found = text.find(at);
    if (found == text.npos)
        return std::nullopt;
    return Halves{text.substr(0, found), text.substr(found + std::char_traits<char>::length(at))};
}

}  // namespace

NormalText NormalHostname(const std::string &text)
{
    return BlTLIBIsHostname(text.c_str()) ? NormalText(text) : std::nullopt;
}

NormalText NormalIpv4(const std::string &text)
{
    const auto address = IpAddress::In(text);
    const bool valid = address && !address->has_length && address->family == AF_INET && BlTLIBIsIpAddr(text.c_str());
    return valid ? NormalText(text) : std::nullopt;
}

NormalText NormalIpv4Card(const std::string &text)
{
    const auto address = IpAddress::In(text);
    if (!address || address->length < 1 || !NormalIpv4(PlainAddress(text)))
        return std::nullopt;
    // With 31 and 32 bits there is no room for a network and a broadcast address.
    const bool hosts = address->length >= 31 || (!address->HostIs(false) && !address->HostIs(true));
    return hosts && address->has_length ? NormalText(text) : std::nullopt;
}

NormalText NormalIpv6(const std::string &text)
{
    const auto address = IpAddress::In(text);
    if (!address || address->has_length || address->family != AF_INET6)
        return std::nullopt;
    in6_addr bits;
    std::memcpy(&bits, address->bytes, sizeof bits);
    const bool host = !IN6_IS_ADDR_UNSPECIFIED(&bits) && !IN6_IS_ADDR_MULTICAST(&bits) && !IN6_IS_ADDR_LOOPBACK(&bits);
    return host ? NormalText(address->Plain()) : std::nullopt;
}

NormalText NormalIpv6Card(const std::string &text)
{
    const auto address = IpAddress::In(text);
    const NormalText plain = NormalIpv6(PlainAddress(text));
    // The kernel makes the link's own address itself.
    if (!address || !address->has_length || address->length < 1 || !plain || plain->starts_with("fe80:"))
        return std::nullopt;
    return address->Text();
}

NormalText NormalServer(const std::string &text)
{
    return text.find(':') == text.npos ? NormalIpv4(text) : NormalIpv6(text);
}

NormalText NormalDomain(const std::string &text)
{
    return BlTLIBIsDomain(text.c_str()) ? NormalText(text) : std::nullopt;
}

NormalText NormalRoute(const std::string &text)
{
    const auto via = Split(text, " via ");
    const auto network = IpAddress::In(via ? via->before : text);
    if (!network || !network->has_length || network->length < 1 || !network->HostIs(false))
        return std::nullopt;
    if (!via)
        return network->Text();
    const NormalText router = network->family == AF_INET ? NormalIpv4(via->after) : NormalIpv6(via->after);
    return router ? NormalText(network->Text() + " via " + *router) : std::nullopt;
}

NormalText NormalInterface(const std::string &text)
{
    const bool valid = !text.empty() && text.size() < IFNAMSIZ && text[0] != '-' && text != "." && text != ".." &&
                       text != "lo" && std::all_of(text.begin(), text.end(), [](unsigned char c) {
                           return (c < 0x80 && std::isalnum(c)) || c == '.' || c == '-' || c == '_';
                       });
    return valid ? NormalText(text) : std::nullopt;
}

NormalText NormalBondMode(const std::string &text)
{
    return text == "lacp" || text == "adaptive" || text == "backup" ? NormalText(text) : std::nullopt;
}

NormalText NormalCardMode(const std::string &text)
{
    return text == "dhcp" || text == "static" || text == "none" ? NormalText(text) : std::nullopt;
}

std::optional<IpAddress> IpAddress::In(const std::string &text)
{
    IpAddress found;
    found.family = text.find(':') == text.npos ? AF_INET : AF_INET6;
    const unsigned most = found.family == AF_INET ? 32 : 128;
    const auto halves = Split(text, "/");
    if (::inet_pton(found.family, PlainAddress(text).c_str(), found.bytes) != 1)
        return std::nullopt;
    const auto length = halves ? NumberIn<unsigned>(halves->after) : most;
    // Strict: no leading zero.
    if (!length || *length > most || (halves && std::to_string(*length) != halves->after))
        return std::nullopt;
    found.length = *length;
    found.has_length = halves.has_value();
    return found;
}

std::string IpAddress::Plain() const
{
    char text[INET6_ADDRSTRLEN] = "";
    ::inet_ntop(family, bytes, text, sizeof text);
    return text;
}

std::string IpAddress::Text() const
{
    return Plain() + "/" + std::to_string(length);
}

bool IpAddress::HostIs(bool ones) const
{
    return std::memcmp(bytes, WithHost(ones).bytes, sizeof bytes) == 0;
}

IpAddress IpAddress::WithHost(bool ones) const
{
    IpAddress changed = *this;
    for (unsigned bit = length; bit < (family == AF_INET ? 32U : 128U); ++bit) {
        const auto mask = static_cast<uint8_t>(0x80U >> bit % 8);
        uint8_t &byte = changed.bytes[bit / 8];
        byte = static_cast<uint8_t>(ones ? byte | mask : byte & ~mask);
    }
    return changed;
}

std::string PlainAddress(const std::string &address)
{
    return address.substr(0, address.find('/'));
}

std::string NetworkOf(const std::string &card_address)
{
    const auto address = IpAddress::In(card_address);
    return address ? address->WithHost(false).Text() : "";
}

std::string MaskOf(const std::string &card_address)
{
    const std::string length = std::to_string(IpAddress::In(card_address).value().length);
    return IpAddress::In("255.255.255.255/" + length)->WithHost(false).Plain();
}

int LengthOfMask(const std::string &mask)
{
    in_addr address = {};
    ::inet_pton(AF_INET, mask.c_str(), &address);
    return std::popcount(address.s_addr);
}

bool IsInNetwork(const std::string &address, const std::string &card_address)
{
    const std::string network = NetworkOf(card_address);
    return !network.empty() && network == NetworkOf(address + network.substr(network.find('/')));
}

}  // namespace tavoctl
