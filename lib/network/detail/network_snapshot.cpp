// The parts of the network that a checkpoint records: the steps that restore them.
#include "core/detail/shell_command.h"
#include "core/detail/text_fields.h"
#include "network/detail/checkpoint.h"
#include "network/detail/connected_route.h"
#include "network/detail/dhcp_client.h"
#include "network/detail/file_state.h"
#include "network/detail/interface_file.h"
#include "network/detail/live_card.h"
#include "network/detail/process_identity.h"

#include <algorithm>
#include <charconv>

#include <net/route.h>
#include <unistd.h>

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
    auto all = LiveAddresses(interface);
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
    const pid_t client = DhcpClientOf(interface);
    const auto stored = StoredAddress(dhcp ? DhcpLeaseFile(interface) : file);
    const auto address = stored ? stored : AddressOf(interface);

    AddClientsEnd(interface, client);
    if (LiveAddresses(interface).size() > 1)  // ifconfig would give its mask to one of the others
        AddCommand(ShellCommand("/sbin/ip -4 addr flush dev %s > /dev/null 2>&1", interface).value_or(""));
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
    const std::vector<InterfaceAddress> addresses = LiveAddresses(interface);
    for (size_t i = 1; i < addresses.size(); ++i)
        AddCommand(ShellCommand("/sbin/ip addr add %s/%d dev %s > /dev/null 2>&1", addresses[i].address.Text(),
                                PrefixLength(addresses[i].mask).value_or(32), interface)
                       .value_or(""));
}

void Checkpoint::AddLiveCard(const std::string &interface)
{
    const pid_t client = DhcpClientOf(interface);
    const std::vector<InterfaceAddress> addresses = LiveAddresses(interface);
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
    if (const std::string bits = LiveWakeBits(interface); !bits.empty())
        steps_.push_back({UndoStep::wake, interface, bits, {}});
    // Switching it off takes every address and route away.
    AddCommand(ShellCommand("/bin/echo 1 > %s", Ipv6Switch(interface)).value_or(""));
    AddIpv6(interface);
    AddRoutes(LiveRoutes(), interface);
    if (client > 0)
        steps_.push_back({UndoStep::client, interface, {}, {}});
}

void Checkpoint::AddIpv6Address(const std::string &interface, const std::string &address, int length)
{
    const auto addresses = LiveIpv6Addresses(interface);
    const std::string both = address + "/" + std::to_string(length);
    const bool there = std::find(addresses.begin(), addresses.end(), both) != addresses.end();
    AddCommand(ShellCommand("/sbin/ip -6 addr %s %s/%d dev %s > /dev/null 2>&1", there ? "add" : "del", address, length,
                            interface)
                   .value_or(""),
               true);
}

void Checkpoint::AddIpv6(const std::string &interface)
{
    const auto off = ReadKernelFile(Ipv6Switch(interface).c_str());
    if (!off)
        return;
    AddCommand(ShellCommand("/bin/echo %s > %s", off->substr(0, 1), Ipv6Switch(interface)).value_or(""), true);
    for (const std::string &address : LiveIpv6Addresses(interface)) {
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
