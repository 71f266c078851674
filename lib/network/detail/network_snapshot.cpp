// What a checkpoint keeps of each part of the network.
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

#include <algorithm>
#include <charconv>

#include <net/if.h>
#include <net/route.h>

namespace tavo {
namespace {

UndoStep FileStep(const FileState &file)
{
    if (!file.text)
        return {UndoStep::no_file, file.path, {}, {}};
    char mode[8];
    const auto [end, error] = std::to_chars(mode, mode + sizeof mode, file.mode, 8);
    return {UndoStep::file, file.path, *file.text, error == std::errc() ? std::string(mode, end) : "644"};
}

// The value as it is in the file, with any quotation marks.
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

std::string Ipv6OfHex(std::string_view hex)
{
    in6_addr address{};
    for (size_t i = 0; i < sizeof address.s6_addr && hex.size() >= 2 * i + 2; ++i)
        std::from_chars(hex.data() + 2 * i, hex.data() + 2 * i + 2, address.s6_addr[i], 16);
    return Ipv6Text(address);
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
    const auto own = AddressOf(interface);
    const auto is_own_network = [&](const Route &route) {
        return own && !(route.flags & RTF_GATEWAY) && route.mask == own->mask &&
               route.destination.Word() == (own->address.Word() & own->mask.Word());
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

void Checkpoint::AddCard(const std::string &interface)
{
    const std::string file = InterfaceFile(interface);
    const bool dhcp = ReadSetting(file, "BOOTPROTO") == "dhcp";
    const pid_t client = HasDhcpClient(interface) ? ReadPidFile(DhcpPidFile(interface).c_str()).value_or(0) : 0;
    const auto stored = StoredAddress(dhcp ? DhcpLeaseFile(interface) : file);
    const auto address = stored ? stored : AddressOf(interface);

    steps_.push_back(
        {UndoStep::end_clients, interface, std::to_string(client), client > 0 ? BeginningOf(client) : "", true});
    AddCommand(ShellCommand("/sbin/ifconfig %s 0.0.0.0 > /dev/null 2>&1", interface).value_or(""), true);
    if (address)
        steps_.push_back({UndoStep::address, AddressCommand(interface, *address), {}, {}});
    else if (!IsUp(interface))
        AddCommand(ShellCommand("/sbin/ifconfig %s down > /dev/null 2>&1", interface).value_or(""), true);
    AddRoutes(LiveRoutes(), interface);
    if (client > 0)
        steps_.push_back({UndoStep::client, interface, {}, {}});
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
    const auto off = ReadKernelFile(("/proc/sys/net/ipv6/conf/" + interface + "/disable_ipv6").c_str());
    if (!off)
        return;
    AddCommand(
        ShellCommand("/bin/echo %s > %s%s%s", off->substr(0, 1), "/proc/sys/net/ipv6/conf/", interface, "/disable_ipv6")
            .value_or(""),
        true);
    for (const std::string &address : Ipv6Addresses(interface)) {
        if (!address.starts_with("fe80:"))
            AddCommand(ShellCommand("/sbin/ip -6 addr add %s dev %s > /dev/null 2>&1", address, interface).value_or(""),
                       true);
    }
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
        if (flags & RTF_GATEWAY)
            AddCommand(ShellCommand("/sbin/ip -6 route add %s/%d via %s dev %s > /dev/null 2>&1", Ipv6OfHex(field[0]),
                                    length, Ipv6OfHex(field[4]), interface)
                           .value_or(""),
                       true);
    }
}

}  // namespace tavo
