// Addresses, masks and names against the C library and plain models, and what the kernel's tables are read as.
#include "tavo_net.h"

#include "input.h"
#include "network/detail/hosts_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv6_route_table.h"
#include "network/detail/ipv6_text.h"
#include "network/detail/route_table.h"
#include "network/detail/socket_table.h"

#include <cstring>
#include <optional>
#include <vector>

#include <arpa/inet.h>
#include <netdb.h>

using fuzz::Check;

namespace {

// Four numbers of one to three digits, read digit by digit.
std::optional<uint32_t> PlainIpv4(const std::string &text)
{
    uint32_t word = 0;
    size_t at = 0;
    for (int part = 0; part < 4; ++part) {
        unsigned value = 0;
        size_t digits = 0;
        for (; at < text.size() && text[at] >= '0' && text[at] <= '9'; ++at, ++digits)
            value = digits < 3 ? value * 10 + static_cast<unsigned>(text[at] - '0') : 1000;
        if (digits == 0 || digits > 3 || value > 255 || (part < 3 && (at == text.size() || text[at++] != '.')))
            return std::nullopt;
        word = word << 8 | value;
    }
    return at == text.size() ? std::optional(word) : std::nullopt;
}

std::string Dotted(uint32_t word)
{
    const in_addr address = {htonl(word)};
    char text[INET_ADDRSTRLEN];
    return ::inet_ntop(AF_INET, &address, text, sizeof text);
}

bool IsMask(uint32_t word)
{
    return (~word & (~word + 1)) == 0;
}

void CheckIpv4(const std::string &text)
{
    const auto plain = PlainIpv4(text);
    const uint32_t word = plain.value_or(0);
    const uint32_t first = word >> 24;
    const bool host = plain && first >= 1 && first <= 223 && first != 127 && (word & 0xFF) <= 254;
    Check(BlTLIBIsIpAddr(text.c_str()) == host, "an address that a host can have");
    if (host) {
        addrinfo hints = {};
        hints.ai_flags = AI_NUMERICHOST;
        hints.ai_family = AF_INET;
        addrinfo *found = nullptr;
        Check(::getaddrinfo(Dotted(word).c_str(), nullptr, &hints, &found) == 0, "the C library takes it");
        ::freeaddrinfo(found);
    }
    in_addr strict;
    if (::inet_pton(AF_INET, text.c_str(), &strict) == 1)
        Check(plain && ntohl(strict.s_addr) == word, "what the C library takes is that address");

    std::vector<char> mask(text.begin(), text.end());
    mask.push_back(0);
    const bool is_mask = plain && IsMask(word);
    Check(BlTLIBIsIpMask(mask.data()) == is_mask, "a mask");
    Check(mask.data() == (is_mask ? Dotted(word) : text), "in its canonical form, or untouched");
}

void CheckSubnets(const std::string &text)
{
    const size_t slash = text.find('/');
    const auto address = PlainIpv4(text.substr(0, slash));
    const auto mask = slash == text.npos ? std::nullopt : PlainIpv4(text.substr(slash + 1));
    Check(BlTLIBIsSubNet(text.c_str()) == (address && mask && IsMask(*mask)), "an address and a mask");

    std::string in = text;
    char out[64] = "untouched";
    const int result = ErrTLIBIpMaskToSubnet(in.data(), out);
    Check(in == text, "only the output is written");
    if (result != 0) {
        Check(std::strcmp(out, "untouched") == 0, "nothing is written on failure");
        return;
    }
    Check(address && mask && IsMask(*mask), "of an address and a mask");
    const std::string network = Dotted(*address & *mask);
    Check(std::string(out).starts_with(network + "/"), "the network");
    char back[64];
    if (*mask == 0)
        Check(ErrTLIBSubnetToIpMask(out, back) != 0, "no bits are no length");
    else
        Check(ErrTLIBSubnetToIpMask(out, back) == 0 && back == network + "/" + Dotted(*mask), "and back");
}

void CheckNames(const std::string &text)
{
    in6_addr ignored;
    Check(BlTLIBIsv6IpAddrValid(text.c_str()) == (::inet_pton(AF_INET6, text.c_str(), &ignored) == 1), "IPv6");
    if (const auto address = tavo::ParseIpv6(text.c_str()))
        Check(tavo::ParseIpv6(tavo::Ipv6Text(*address).c_str()).has_value(), "written, it is one again");
    if (BlTLIBIsHostname(text.c_str()))
        Check(tavo::IsInterfaceName(text) && text.size() <= 15, "a host name is harmless");
    if (BlTLIBIsMailbox(text.c_str()))
        Check(BlTLIBIsDomain(text.substr(text.find('@') + 1).c_str()), "a mailbox ends in a domain");
    if (BlTLIBIsDomain(text.c_str()))
        Check(text.size() <= 255 && text.find("..") == text.npos && BlTLIBIsMailbox(("a@" + text).c_str()), "a domain");
    if (tavo::IsInterfaceName(text))
        Check(text.find_first_of("/ ;$`'\"\\\n\t*?<>|&") == text.npos && text != ".." && text[0] != '-', "no syntax");
}

void CheckTables(const std::string &text, const std::string &word)
{
    if (const auto routes = tavo::ParseRouteTable(text)) {
        for (const tavo::Route &route : *routes)
            Check(PlainIpv4(route.gateway.Text()).has_value() && !route.interface.empty(), "a route");
    }
    if (const auto port = tavo::LocalPort(text))
        Check(*port >= 0 && *port <= 0xFFFF, "a port");
    for (const std::string &address : tavo::ParseIpv6Table(text, word))
        Check(BlTLIBIsv6IpAddrValid(address.substr(0, address.find('/')).c_str()), "an address of the table");
    for (const tavo::LiveIpv6Route &route : tavo::ParseIpv6RouteTable(text, word))
        Check(BlTLIBIsv6IpAddrValid(route.destination.substr(0, route.destination.find('/')).c_str()) &&
                  (route.gateway.empty() || BlTLIBIsv6IpAddrValid(route.gateway.c_str())),
              "a route of the table");
    const std::string hosts = tavo::HostsWithName(text, "", "nas", "192.0.2.1");
    Check(tavo::HostsWithName(hosts, "", "nas", "192.0.2.1") == hosts, "a second time nothing changes");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    fuzz::Input input(data, size);
    const std::string word = input.Text(20);
    const std::string text = input.Rest();
    CheckIpv4(text);
    CheckSubnets(text);
    CheckNames(text);
    CheckTables(text, word);
    return 0;
}
