// What the kernel has for one interface.
#include "network/detail/live_card.h"

#include "core/detail/strict_number.h"
#include "network/detail/connected_route.h"
#include "network/detail/dhcp_client.h"
#include "network/detail/ipv6_text.h"
#include "network/detail/wake_on_lan.h"

#include <cstring>

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <net/if.h>

namespace tavo {
namespace {

Ipv4 AddressIn(const sockaddr *address)
{
    sockaddr_in in;
    std::memcpy(&in, address, sizeof in);
    return Ipv4::FromWord(ntohl(in.sin_addr.s_addr));
}

}  // namespace

bool IsUp(const std::string &interface)
{
    const std::string flags = InterfaceAttribute(interface, "flags");
    const std::string_view digits = std::string_view(flags).substr(flags.starts_with("0x") ? 2 : 0);
    return (LeadingNumber(digits, 0u, 16) & IFF_UP) != 0;
}

std::vector<InterfaceAddress> LiveAddresses(const std::string &interface)
{
    std::vector<InterfaceAddress> found;
    ifaddrs *all = nullptr;
    if (::getifaddrs(&all) != 0)
        return found;
    for (const ifaddrs *one = all; one; one = one->ifa_next) {
        const std::string_view label = one->ifa_name;  // "eth0:1" of an address with a label
        if (one->ifa_addr && one->ifa_netmask && one->ifa_addr->sa_family == AF_INET &&
            label.substr(0, label.find(':')) == interface)
            found.push_back({AddressIn(one->ifa_addr), AddressIn(one->ifa_netmask)});
    }
    ::freeifaddrs(all);
    return found;
}

std::vector<std::string> LiveIpv6Addresses(const std::string &interface)
{
    return ParseIpv6Table(ReadKernelFile("/proc/net/if_inet6").value_or(""), interface);
}

std::vector<LiveIpv6Route> LiveIpv6Routes(const std::string &interface)
{
    return ParseIpv6RouteTable(ReadKernelFile("/proc/net/ipv6_route").value_or(""), interface);
}

std::string Ipv6Switch(const std::string &interface)
{
    return "/proc/sys/net/ipv6/conf/" + interface + "/disable_ipv6";
}

std::string LiveWakeBits(const std::string &interface)
{
    if (!IsWakeOnLanSupported() || IsWokenByPanel())
        return "";
    const auto wake = GetWakeSettings(interface.c_str());
    return wake ? std::to_string(wake->enabled) : "";
}

std::string LiveCardText(const std::string &interface)
{
    std::string text = InterfaceAttribute(interface, "mtu") + (IsUp(interface) ? " up" : " down") +
                       (DhcpClientOf(interface) > 0 ? " client " : " ") + LiveWakeBits(interface) + "\n";
    for (const InterfaceAddress &one : LiveAddresses(interface))
        text += one.address.Text() + "/" + one.mask.Text() + "\n";
    for (const Route &route : LiveRoutes()) {
        if (route.interface == interface)
            text += RouteText(route) + "\n";
    }
    text += ReadKernelFile(Ipv6Switch(interface).c_str()).value_or("");
    for (const std::string &address : LiveIpv6Addresses(interface))
        text += address + "\n";
    for (const LiveIpv6Route &route : LiveIpv6Routes(interface))
        text += route.destination + " " + route.gateway + "\n";
    return text;
}

}  // namespace tavo
