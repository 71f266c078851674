// The parts of the network that a checkpoint records.
#include "network/detail/checkpoint.h"

#include "core/detail/pid_file.h"
#include "core/detail/shell_command.h"
#include "core/detail/text_fields.h"
#include "network/detail/connected_route.h"
#include "network/detail/dhcp_client.h"
#include "network/detail/file_state.h"
#include "network/detail/interface_file.h"
#include "network/detail/ipv6_text.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/process_identity.h"

#include <algorithm>
#include <charconv>
#include <cstring>

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <net/if.h>
#include <net/route.h>

namespace tavo {
namespace {

constexpr const char *kIpv6Settings = "/proc/sys/net/ipv6/conf/";

UndoStep FileStep(const FileState &file)
{
    if (!file.text)
        return {UndoStep::no_file, file.path, {}, {}};
    char mode[8];
    const auto [end, error] = std::to_chars(mode, mode + sizeof mode, file.mode, 8);
    return {UndoStep::file, file.path, *file.text, error == std::errc() ? std::string(mode, end) : "644"};
}

// The value exactly as in the file, with any quotation marks.
std::string RawSetting(const char *path, const std::string &key)
{
    const std::string text = ReadKernelFile(path).value_or("");
    for (std::string_view rest = text; !rest.empty();) {
        const std::string_view line = TakeLine(rest);
        if (line.starts_with(key) && line.substr(key.size()).starts_with('='))
            return std::string(line.substr(key.size() + 1));
    }
    return ReadSetting(path, key.c_str());
}

std::optional<InterfaceAddress> StoredAddress(const std::string &file)
{
    const auto address = ParseIpv4(ReadSetting(file, "IPADDR"));
    const auto mask = ParseIpv4(ReadSetting(file, "NETMASK"));
    if (!address || !mask)
        return std::nullopt;
    return InterfaceAddress{*address, *mask};
}

std::string AddressCommand(const std::string &interface, const InterfaceAddress &own)
{
    return ShellCommand("/sbin/ifconfig %s %s netmask %s broadcast %s > /dev/null 2>&1", interface, own.address.Text(),
                        own.mask.Text(), Ipv4::FromWord(own.address.Word() | ~own.mask.Word()).Text())
        .value_or("");
}

bool IsUp(const std::string &interface)
{
    const std::string flags = InterfaceAttribute(interface, "flags");
    unsigned value = 0;
    const size_t start = flags.starts_with("0x") ? 2 : 0;
    std::from_chars(flags.data() + start, flags.data() + flags.size(), value, 16);
    return (value & IFF_UP) != 0;
}

std::vector<std::string> Ipv6Addresses(const std::string &interface)
{
    return ParseIpv6Table(ReadKernelFile("/proc/net/if_inet6").value_or(""), interface);
}

// All IPv4 addresses of an interface, the first one first.
std::vector<InterfaceAddress> Addresses(const std::string &interface)
{
    std::vector<InterfaceAddress> found;
    ifaddrs *all = nullptr;
    if (::getifaddrs(&all) != 0)
        return found;
    const auto text = [](const sockaddr *address) {
        sockaddr_in in;
        std::memcpy(&in, address, sizeof in);
        return Ipv4::FromWord(ntohl(in.sin_addr.s_addr));
    };
    for (const ifaddrs *one = all; one; one = one->ifa_next) {
        const std::string_view label = one->ifa_name;  // "eth0:1" of an address with a label
        if (one->ifa_addr && one->ifa_netmask && one->ifa_addr->sa_family == AF_INET &&
            label.substr(0, label.find(':')) == interface)
            found.push_back({text(one->ifa_addr), text(one->ifa_netmask)});
    }
    ::freeifaddrs(all);
    return found;
}

std::string Ipv6OfHex(std::string_view hex)
{
    in6_addr address{};
    for (size_t i = 0; i < sizeof address.s6_addr && hex.size() >= 2 * i + 2; ++i)
        std::from_chars(hex.data() + 2 * i, hex.data() + 2 * i + 2, address.s6_addr[i], 16);
    return Ipv6Text(address);
}

struct LiveIpv6Route {
    std::string destination;  // "2001:db8::/32"
    std::string gateway;      // empty for a network on the link
};

// Without those that come and go with an address or with the link itself.
std::vector<LiveIpv6Route> LiveIpv6Routes(const std::string &interface)
{
    constexpr unsigned kernels_own = 0x80000000u | 0x00100000u;  // RTF_LOCAL, RTF_ANYCAST
    constexpr std::string_view address_metric = "00000100";      // of the network that an address brings
    std::vector<LiveIpv6Route> found;
    // "DESTINATION LENGTH SOURCE LENGTH GATEWAY METRIC REFERENCES USES FLAGS INTERFACE", in hexadecimal
    const std::string table = ReadKernelFile("/proc/net/ipv6_route").value_or("");
    for (std::string_view rest = table; !rest.empty();) {
        const auto field = SplitFields(TakeLine(rest));
        unsigned flags = 0;
        unsigned length = 0;
        if (field.size() != 10 || field[9] != interface)
            continue;
        std::from_chars(field[8].data(), field[8].data() + field[8].size(), flags, 16);
        std::from_chars(field[1].data(), field[1].data() + field[1].size(), length, 16);
        if ((flags & kernels_own) != 0 || (!(flags & RTF_GATEWAY) && field[5] == address_metric) ||
            field[0].starts_with("fe80") || field[0].starts_with("ff"))
            continue;
        found.push_back(
            {Ipv6OfHex(field[0]) + "/" + std::to_string(length), flags & RTF_GATEWAY ? Ipv6OfHex(field[4]) : ""});
    }
    return found;
}

pid_t ClientOf(const std::string &interface)
{
    return HasDhcpClient(interface) ? ReadPidFile(DhcpPidFile(interface).c_str()).value_or(0) : 0;
}

}  // namespace

bool Checkpoint::AddFile(const std::string &path)
{
    const auto known = [&](const UndoStep &step) {
        return step.IsOfFiles() && step.target == path;
    };
    if (std::any_of(steps_.begin(), steps_.end(), known))
        return true;
    const auto file = ReadFileState(path);
    if (file)
        steps_.push_back(FileStep(*file));
    return file.has_value();
}

bool Checkpoint::AddInterfaceFiles()
{
    const auto files = ReadInterfaceFiles();
    for (const FileState &file : files.value_or(std::vector<FileState>()))
        steps_.push_back(FileStep(file));
    return files.has_value();
}

void Checkpoint::AddSetting(const char *path, const std::string &key)
{
    const std::string value = RawSetting(path, key);
    steps_.push_back({value.empty() ? UndoStep::no_setting : UndoStep::setting, path, value, key});
}

void Checkpoint::AddHostName()
{
    char name[256] = "";
    if (::gethostname(name, sizeof name - 1) == 0)
        steps_.push_back({UndoStep::host_name, name, {}, {}, true});
}

void Checkpoint::AddCommand(std::string command, bool after_death)
{
    steps_.push_back({UndoStep::command, std::move(command), {}, {}, after_death});
}

void Checkpoint::AddMtu(const std::string &interface)
{
    const std::string mtu = InterfaceAttribute(interface, "mtu");
    if (const auto command = ShellCommand("/sbin/ifconfig %s mtu %s > /dev/null 2>&1", interface, mtu); !mtu.empty())
        AddCommand(command.value_or(""));
}

void Checkpoint::AddGateway()
{
    AddCommand("/sbin/route delete default > /dev/null 2>&1", true);
    const std::vector<Route> routes = LiveRoutes();
    for (auto route = routes.rbegin(); route != routes.rend(); ++route) {
        if (route->IsDefault())
            steps_.push_back({UndoStep::route, RouteCommand(*route), RouteText(*route), {}});
    }
}

void Checkpoint::AddRoutes(const std::vector<Route> &routes, const std::string &interface)
{
    auto all = Addresses(interface);
    if (const auto first = AddressOf(interface))
        all.push_back(*first);
    const auto is_own_network = [&](const Route &route) {
        return !(route.flags & RTF_GATEWAY) && std::any_of(all.begin(), all.end(), [&](const InterfaceAddress &own) {
            return route.mask == own.mask && route.destination.Word() == (own.address.Word() & own.mask.Word());
        });
    };
    // Networks on the link first, a router may be on one. From the last one on: a new route goes before its equals.
    for (const uint32_t through_router : {0u, uint32_t{RTF_GATEWAY}}) {
        for (auto route = routes.rbegin(); route != routes.rend(); ++route) {
            if (route->interface == interface && (route->flags & RTF_GATEWAY) == through_router &&
                !is_own_network(*route))
                steps_.push_back({UndoStep::route, RouteCommand(*route), RouteText(*route), {}});
        }
    }
}

void Checkpoint::AddClientsEnd(const std::string &interface, pid_t client)
{
    steps_.push_back(
        {UndoStep::end_clients, interface, std::to_string(client), client > 0 ? BeginningOf(client) : "", true});
    AddCommand(ShellCommand("/sbin/ifconfig %s 0.0.0.0 > /dev/null 2>&1", interface).value_or(""), true);
}

void Checkpoint::AddCard(const std::string &interface)
{
    const std::string file = InterfaceFile(interface);
    const bool dhcp = ReadSetting(file, "BOOTPROTO") == "dhcp";
    const pid_t client = ClientOf(interface);
    const auto stored = StoredAddress(dhcp ? DhcpLeaseFile(interface) : file);
    const auto address = stored ? stored : AddressOf(interface);

    AddClientsEnd(interface, client);
    if (address)
        steps_.push_back({UndoStep::address, AddressCommand(interface, *address), {}, {}});
    else if (!IsUp(interface))
        AddCommand(ShellCommand("/sbin/ifconfig %s down > /dev/null 2>&1", interface).value_or(""), true);
    AddFurtherAddresses(interface);
    AddRoutes(LiveRoutes(), interface);
    if (client > 0)
        steps_.push_back({UndoStep::client, interface, {}, {}});
}

void Checkpoint::AddFurtherAddresses(const std::string &interface)
{
    const std::vector<InterfaceAddress> addresses = Addresses(interface);
    for (size_t i = 1; i < addresses.size(); ++i)
        AddCommand(ShellCommand("/sbin/ip addr add %s/%d dev %s > /dev/null 2>&1", addresses[i].address.Text(),
                                PrefixLength(addresses[i].mask).value_or(32), interface)
                       .value_or(""));
}

void Checkpoint::AddLiveCard(const std::string &interface)
{
    const pid_t client = ClientOf(interface);
    const std::vector<InterfaceAddress> addresses = Addresses(interface);
    steps_.push_back({UndoStep::card, interface, LiveCardText(interface), {}});
    AddClientsEnd(interface, client);
    AddCommand(ShellCommand("/sbin/ip -4 addr flush dev %s > /dev/null 2>&1", interface).value_or(""));
    if (!addresses.empty())
        steps_.push_back({UndoStep::address, AddressCommand(interface, addresses.front()), {}, {}});
    else
        AddCommand(ShellCommand("/sbin/ifconfig %s %s > /dev/null 2>&1", interface, IsUp(interface) ? "up" : "down")
                       .value_or(""));
    AddFurtherAddresses(interface);
    AddMtu(interface);
    // Switching it off takes every address and route away.
    AddCommand(ShellCommand("/bin/echo 1 > %s%s%s", kIpv6Settings, interface, "/disable_ipv6").value_or(""));
    AddIpv6(interface);
    AddRoutes(LiveRoutes(), interface);
    if (client > 0)
        steps_.push_back({UndoStep::client, interface, {}, {}});
}

std::string LiveCardText(const std::string &interface)
{
    std::string text = InterfaceAttribute(interface, "mtu") + (IsUp(interface) ? " up" : " down") +
                       (ClientOf(interface) > 0 ? " client\n" : "\n");
    for (const InterfaceAddress &one : Addresses(interface))
        text += one.address.Text() + "/" + one.mask.Text() + "\n";
    for (const Route &route : LiveRoutes()) {
        if (route.interface == interface)
            text += RouteText(route) + "\n";
    }
    text += ReadKernelFile((kIpv6Settings + interface + "/disable_ipv6").c_str()).value_or("");
    for (const std::string &address : Ipv6Addresses(interface))
        text += address + "\n";
    for (const LiveIpv6Route &route : LiveIpv6Routes(interface))
        text += route.destination + " " + route.gateway + "\n";
    return text;
}

void Checkpoint::AddIpv6Address(const std::string &interface, const std::string &address, int length)
{
    const auto addresses = Ipv6Addresses(interface);
    const std::string both = address + "/" + std::to_string(length);
    const bool there = std::find(addresses.begin(), addresses.end(), both) != addresses.end();
    AddCommand(ShellCommand("/sbin/ip -6 addr %s %s/%d dev %s > /dev/null 2>&1", there ? "add" : "del", address, length,
                            interface)
                   .value_or(""),
               true);
}

void Checkpoint::AddIpv6(const std::string &interface)
{
    const auto off = ReadKernelFile((kIpv6Settings + interface + "/disable_ipv6").c_str());
    if (!off)
        return;
    AddCommand(ShellCommand("/bin/echo %s > %s%s%s", off->substr(0, 1), kIpv6Settings, interface, "/disable_ipv6")
                   .value_or(""),
               true);
    for (const std::string &address : Ipv6Addresses(interface)) {
        if (!address.starts_with("fe80:"))
            AddCommand(ShellCommand("/sbin/ip -6 addr add %s dev %s > /dev/null 2>&1", address, interface).value_or(""),
                       true);
    }
    for (const LiveIpv6Route &route : LiveIpv6Routes(interface)) {
        const std::string via = route.gateway.empty() ? "" : " via " + route.gateway;
        AddCommand(ShellCommand("/sbin/ip -6 route add %s%s dev %s > /dev/null 2>&1", route.destination,
                                ComposedPiece{via}, interface)
                       .value_or(""),
                   true);
    }
}

}  // namespace tavo
