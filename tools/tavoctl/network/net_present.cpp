// The network as its files have it and as the kernel has it.
#include "network/net_present.h"

#include "tavo_file.h"
#include "tavo_net.h"

#include "frame/containers.h"
#include "frame/files.h"
#include "frame/text.h"
#include "network/net_text.h"
#include "network/net_verbs.h"

#include <algorithm>
#include <cstring>
#include <iterator>
#include <sstream>

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <net/route.h>
#include <unistd.h>

namespace tavoctl {
namespace {

Words Fields(const std::string &line)
{
    std::istringstream in(line);
    return {std::istream_iterator<std::string>(in), {}};
}

std::vector<Words> Rows(const std::string &path)
{
    return Mapped(Split(FileText(path), '\n'), Fields);
}

std::string Attribute(const std::string &interface, const char *name)
{
    return KernelText("/sys/class/net/" + interface + "/" + name).value_or("");
}

unsigned Hex(const std::string &text)
{
    return NumberIn<unsigned>(text, 16).value_or(0);
}

std::string Ipv4OfHex(const std::string &text)
{
    const in_addr address = {Hex(text)};  // as the kernel has it in memory
    return ::inet_ntoa(address);
}

std::string Ipv6OfHex(const std::string &text)
{
    in6_addr address = {};
    for (std::size_t i = 0; i < sizeof address.s6_addr && text.size() >= 2 * i + 2; ++i)
        address.s6_addr[i] = static_cast<uint8_t>(Hex(text.substr(2 * i, 2)));
    char out[INET6_ADDRSTRLEN] = "";
    ::inet_ntop(AF_INET6, &address, out, sizeof out);
    return out;
}

// "192.0.2.10/24" in the kernel's order.
Words Ipv4Addresses(const std::string &interface)
{
    Words found;
    ifaddrs *all = nullptr;
    if (::getifaddrs(&all) != 0)
        return found;
    const auto text = [](const sockaddr *address) {
        sockaddr_in in;
        std::memcpy(&in, address, sizeof in);
        return std::string(::inet_ntoa(in.sin_addr));
    };
    for (const ifaddrs *one = all; one; one = one->ifa_next) {
        const std::string label = one->ifa_name;  // "eth0:1" of an address with a label
        if (one->ifa_addr && one->ifa_netmask && one->ifa_addr->sa_family == AF_INET &&
            label.substr(0, label.find(':')) == interface)
            found.push_back(text(one->ifa_addr) + "/" + std::to_string(LengthOfMask(text(one->ifa_netmask))));
    }
    ::freeifaddrs(all);
    return found;
}

// Those that were set; not the link's own, nor what a router has announced.
Words Ipv6Addresses(const std::string &interface)
{
    constexpr unsigned permanent = 0x80;
    Words found;
    for (const Words &row : Rows("/proc/net/if_inet6"))
        if (row.size() == 6 && row[5] == interface && (Hex(row[4]) & permanent) && !row[0].starts_with("fe80"))
            found.push_back(Ipv6OfHex(row[0]) + "/" + std::to_string(Hex(row[2])));
    std::sort(found.begin(), found.end());
    return found;
}

Words Ipv4Routes(const std::string &interface, const Words &addresses)
{
    Words found;
    for (const Words &row : Rows("/proc/net/route")) {
        if (row.size() < 8 || row[0] != interface || Hex(row[7]) == 0)
            continue;
        const std::string text = Ipv4OfHex(row[1]) + "/" + std::to_string(LengthOfMask(Ipv4OfHex(row[7])));
        const bool routed = (Hex(row[3]) & RTF_GATEWAY) != 0;
        if (routed || !Contains(Mapped(addresses, NetworkOf), text))
            found.push_back(text + (routed ? " via " + Ipv4OfHex(row[2]) : ""));
    }
    return found;
}

struct Ipv6Live {
    std::string gateway;
    Words routes;
};

Ipv6Live Ipv6Routes(const std::string &interface, const Words &addresses)
{
    constexpr unsigned not_set_here =
        0x80000000u | 0x00100000u | 0x00040000u | 0x00010000u;  // local, anycast, announced
    Ipv6Live found;
    for (const Words &row : Rows("/proc/net/ipv6_route")) {
        if (row.size() != 10 || row[9] != interface || row[0].starts_with("fe80") || row[0].starts_with("ff") ||
            (Hex(row[8]) & not_set_here))
            continue;
        const bool routed = (Hex(row[8]) & RTF_GATEWAY) != 0;
        const std::string text = Ipv6OfHex(row[0]) + "/" + std::to_string(Hex(row[1]));
        if (routed && text == "::/0") {
            found.gateway = Ipv6OfHex(row[4]);
            continue;
        }
        const bool own = Contains(Mapped(addresses, NetworkOf), text) || (row[1] == "80" && !addresses.empty());
        if (routed || !own)
            found.routes.push_back(text + (routed ? " via " + Ipv6OfHex(row[4]) : ""));
    }
    return found;
}

// The VLAN's parent and number; "" and 0 for other interfaces.
std::pair<std::string, int> VlanOf(const std::string &interface)
{
    // "eth0.7 | 7 | eth0", below two lines of headings
    for (const Words &row : Rows("/proc/net/vlan/config"))
        if (row.size() == 5 && row[0] == interface && row[1] == "|")
            return {row[4], std::atoi(row[2].c_str())};
    return {};
}

void PutBond(const std::string &interface, NetFactsMap &card)
{
    TAVONETLINKAGGR bond = {};
    if (Attribute(interface, "bonding/mode").empty() || TAVONetLinkAggrGet(interface.c_str(), &bond) != 0 ||
        bond.nMode == TAVO_NET_AGGR_NONE)
        return;
    Words members(bond.rgszMember, bond.rgszMember + bond.nMember);
    std::sort(members.begin(), members.end());
    card["bond"] = bond_modes[bond.nMode];
    card["members"] = members;
}

std::optional<bool> Wakes(const std::string &interface)
{
    const int wakes = TAVONetWolGet(interface.c_str());
    return wakes < 0 ? std::nullopt : std::optional(wakes == 1);
}

bool IsMember(const std::string &interface)
{
    return ::access(("/sys/class/net/" + interface + "/master").c_str(), F_OK) == 0;
}

Words Without(Words words, const std::string &text, char sign, bool wanted)
{
    std::erase_if(words, [&](const std::string &one) { return (one.find(sign) != one.npos) != wanted || one == text; });
    return Sorted(words);
}

NetFactsMap StoredCard(const std::string &interface)
{
    const std::string file = InterfaceFileOf(interface);
    const MoreFile more = ReadMoreFile(interface);
    NetFactsMap card;
    PutBond(interface, card);
    if (more.vlan) {
        card["parent"] = more.parent;
        card["vlan"] = more.vlan;
    }
    const std::string protocol = NetSetting(file, "BOOTPROTO");
    const std::string address = NetSetting(file, "IPADDR");
    const bool fixed = protocol != "dhcp" && protocol != "none" && !address.empty();
    card["mode"] = protocol == "dhcp" ? "dhcp" : fixed ? "static" : "none";
    card["address"] = fixed ? Cell(address + "/" + std::to_string(LengthOfMask(NetSetting(file, "NETMASK")))) : Cell();
    card["more_addresses"] = Without(more.addresses, "", ':', false);
    card["ipv6"] = NetSetting(file, "IPV6INIT") != "no";
    Words ipv6 = Without(more.addresses, "", ':', true);
    if (const std::string one = NetSetting(file, "IPV6ADDR"); !one.empty()) {
        const auto both = NormalIpv6Card(one + "/" + NetSetting(file, "IPV6PREFIXLENG"));
        if (both && !Contains(ipv6, *both))
            ipv6.push_back(*both);
    }
    card["ipv6_addresses"] = Sorted(ipv6);
    card["ipv6_gateway"] = more.ipv6_gateway.empty() ? Cell() : Cell(more.ipv6_gateway);
    card["routes"] = Sorted(more.routes);
    card["mtu"] = std::max(0, TAVOGetMTUSetting(interface.c_str()));
    if (Wakes(interface)) {
        const std::string options = NetSetting("/etc/tavoinfo.conf", interface + "_wol_options");
        card["wake_on_lan"] = !options.empty() && options != "d";
    }
    return card;
}

Words Cards()
{
    Words names;
    for (const std::string &name : InterfaceNames())
        if (Attribute(name, "type") == "1")
            names.push_back(name);
    return names;
}

}  // namespace

std::string MoreFile::Text() const
{
    std::string text;
    if (vlan)
        text += "vlan " + parent + " " + std::to_string(vlan) + "\n";
    for (const std::string &address : addresses)
        text += "address " + address + "\n";
    if (!ipv6_gateway.empty())
        text += "gateway " + ipv6_gateway + "\n";
    for (const std::string &route : routes)
        text += "route " + route + "\n";
    return text;
}

MoreFile ReadMoreFile(const std::string &interface)
{
    MoreFile more;
    for (const Words &row : Rows(net_folder + ("more-" + interface))) {
        const std::string what = row.empty() ? "" : row[0];
        if (what == "vlan" && row.size() == 3) {
            more.parent = row[1];
            more.vlan = std::atoi(row[2].c_str());
        } else if (what == "address" && row.size() == 2) {
            more.addresses.push_back(row[1]);
        } else if (what == "gateway" && row.size() == 2) {
            more.ipv6_gateway = row[1];
        } else if (what == "route" && (row.size() == 2 || row.size() == 4)) {
            more.routes.push_back(row[1] + (row.size() == 4 ? " via " + row[3] : ""));
        }
    }
    return more;
}

std::string NetSetting(const std::string &path, const std::string &key)
{
    char value[256] = "";
    return TLIBFileGetKeyValue(path.c_str(), key.c_str(), value, sizeof value, 0) > 0 ? value : "";
}

std::string InterfaceFileOf(const std::string &interface)
{
    return net_folder + ("ifcfg-" + interface);
}

NetFactsMap LiveCard(const std::string &interface, const std::string &mode)
{
    NetFactsMap card;
    PutBond(interface, card);
    if (const auto [parent, vlan] = VlanOf(interface); vlan) {
        card["parent"] = parent;
        card["vlan"] = vlan;
    }
    if (!IsMember(interface)) {
        const Words addresses = Ipv4Addresses(interface);
        const std::string first = addresses.empty() || mode.empty() || mode == "none" ? "" : addresses.front();
        if (mode != "dhcp")
            card["address"] = first.empty() ? Cell() : Cell(first);
        card["more_addresses"] = Without(addresses, first, ':', false);
        const Words ipv6 = Ipv6Addresses(interface);
        const Ipv6Live live = Ipv6Routes(interface, ipv6);
        card["ipv6"] = BlTAVONetIPv6IsEnabled(interface.c_str()) == 1;
        card["ipv6_addresses"] = ipv6;
        card["ipv6_gateway"] = live.gateway.empty() ? Cell() : Cell(live.gateway);
        Words routes = Ipv4Routes(interface, addresses);
        routes.insert(routes.end(), live.routes.begin(), live.routes.end());
        card["routes"] = Sorted(routes);
    }
    card["mtu"] = std::atoi(Attribute(interface, "mtu").c_str());
    if (const auto wakes = Wakes(interface))
        card["wake_on_lan"] = *wakes;
    return card;
}

NetDocument StoredNet()
{
    NetDocument document;
    const std::string name = NetSetting(network_file, "HOSTNAME");
    if (!name.empty())
        document.net["hostname"] = name;
    const std::string gateway = NetSetting(network_file, "GATEWAY");
    document.net["gateway"] = gateway.empty() ? Cell() : Cell(gateway);
    StringList servers;
    TAVONetDNSGet(servers.Address());
    document.net["dns"] = servers.Items();
    document.net["search"] = Fields(FileText(search_file));
    for (const std::string &card : Cards())
        document.cards[card] = StoredCard(card);
    return document;
}

NetDocument LiveNet(const NetDocument &stored)
{
    NetDocument document;
    char name[256] = "";
    if (::gethostname(name, sizeof name - 1) == 0)
        document.net["hostname"] = name;
    for (const Words &row : Rows(resolver_file))
        if (!row.empty() && row[0] == "search")
            document.net["search"] = Words(row.begin() + 1, row.end());
    document.net.try_emplace("search", Words());
    TAVONETCARD first = {};
    char gateway[20] = "";
    // With DHCP the lease decides.
    if (TAVONetGetCard1(&first) == 0 && stored.cards.contains(first.szInterface) &&
        TextOf(stored.cards.at(first.szInterface), "mode") != "dhcp")
        document.net["gateway"] = TAVONetDefaultGatewayGet(gateway, sizeof gateway) == 0 ? Cell(gateway) : Cell();
    for (const auto &[card, facts] : stored.cards)
        document.cards[card] = LiveCard(card, TextOf(facts, "mode"));
    return document;
}

}  // namespace tavoctl
