// The texts of a document of the network.
#include "network/net_text.h"

#include "tavo_net.h"

#include "frame/text.h"

#include <algorithm>
#include <bit>

#include <arpa/inet.h>
#include <net/if.h>

namespace tavoctl {
namespace {

// Strict: no sign, no blank, no leading zero.
std::optional<unsigned> Length(const std::string &text, unsigned most)
{
    const auto length = NumberIn<unsigned>(text);
    return length && *length <= most && std::to_string(*length) == text ? length : std::nullopt;
}

std::optional<uint32_t> Word(const std::string &text)
{
    in_addr address;
    return ::inet_pton(AF_INET, text.c_str(), &address) == 1 ? std::optional(ntohl(address.s_addr)) : std::nullopt;
}

uint32_t Mask(unsigned length)
{
    return length == 0 ? 0 : ~uint32_t{0} << (32 - length);
}

struct Ipv6 {
    in6_addr address;

    bool IsHosts() const
    {
        return !IN6_IS_ADDR_UNSPECIFIED(&address) && address.s6_addr[0] != 0xFF && !IN6_IS_ADDR_LOOPBACK(&address);
    }
    std::string Text() const
    {
        char text[INET6_ADDRSTRLEN] = "";
        ::inet_ntop(AF_INET6, &address, text, sizeof text);
        return text;
    }
    bool IsNetwork(unsigned length) const
    {
        for (unsigned bit = length; bit < 128; ++bit)
            if (address.s6_addr[bit / 8] & (0x80 >> bit % 8))
                return false;
        return true;
    }
};

std::optional<Ipv6> ToIpv6(const std::string &text)
{
    Ipv6 found;
    return ::inet_pton(AF_INET6, text.c_str(), &found.address) == 1 ? std::optional(found) : std::nullopt;
}

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
    return Word(text) && BlTLIBIsIpAddr(text.c_str()) ? NormalText(text) : std::nullopt;
}

NormalText NormalIpv4Card(const std::string &text)
{
    const auto halves = Split(text, "/");
    const auto length = halves ? Length(halves->after, 32) : std::nullopt;
    if (!length || *length < 1 || !NormalIpv4(halves->before))
        return std::nullopt;
    const uint32_t host = *Word(halves->before) & ~Mask(*length);
    // With 31 and 32 bits there is no room for a network and a broadcast address.
    return *length >= 31 || (host != 0 && host != ~Mask(*length)) ? NormalText(text) : std::nullopt;
}

NormalText NormalIpv6(const std::string &text)
{
    const auto address = ToIpv6(text);
    return address && address->IsHosts() ? NormalText(address->Text()) : std::nullopt;
}

NormalText NormalIpv6Card(const std::string &text)
{
    const auto halves = Split(text, "/");
    const auto address = halves ? NormalIpv6(halves->before) : std::nullopt;
    const auto length = halves ? Length(halves->after, 128) : std::nullopt;
    // The kernel makes the link's own address itself.
    if (!address || !length || *length < 1 || address->starts_with("fe80:"))
        return std::nullopt;
    return *address + "/" + std::to_string(*length);
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
    const auto halves = Split(via ? via->before : text, "/");
    if (!halves)
        return std::nullopt;
    std::string network;
    NormalText router;
    if (text.find(':') == text.npos) {
        const auto address = Word(halves->before);
        const auto length = Length(halves->after, 32);
        if (!address || !length || *length < 1 || (*address & ~Mask(*length)) != 0)
            return std::nullopt;
        network = halves->before + "/" + halves->after;
        router = via ? NormalIpv4(via->after) : std::nullopt;
    } else {
        const auto address = ToIpv6(halves->before);
        const auto length = Length(halves->after, 128);
        if (!address || !length || *length < 1 || !address->IsNetwork(*length))
            return std::nullopt;
        network = address->Text() + "/" + halves->after;
        router = via ? NormalIpv6(via->after) : std::nullopt;
    }
    if (!via)
        return network;
    return router ? NormalText(network + " via " + *router) : std::nullopt;
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

std::string PlainAddress(const std::string &address)
{
    return address.substr(0, address.find('/'));
}

int LengthOfMask(const std::string &mask)
{
    return std::popcount(Word(mask).value_or(0));
}

bool IsInNetwork(const std::string &address, const std::string &card_address)
{
    const auto halves = Split(card_address, "/");
    const auto length = halves ? Length(halves->after, 32) : std::nullopt;
    const auto one = Word(address);
    const auto other = halves ? Word(halves->before) : std::nullopt;
    return length && one && other && ((*one ^ *other) & Mask(*length)) == 0;
}

}  // namespace tavoctl
