// The kernel's IPv6 routes, as /proc/net/ipv6_route lists them.
#include "network/detail/ipv6_route_table.h"

#include "core/detail/text_fields.h"
#include "network/detail/ipv6_text.h"

#include <net/route.h>

namespace tavo {
namespace {

constexpr size_t kFields =
    10;  // destination, length, source, length, gateway, metric, references, uses, flags, interface

constexpr uint32_t kKernelsOwn = 0x80000000u | 0x00100000u;  // RTF_LOCAL, RTF_ANYCAST
constexpr uint32_t kAddressMetric = 0x100;                   // of the network that an address brings

}  // namespace

std::vector<LiveIpv6Route> ParseIpv6RouteTable(std::string_view text, std::string_view interface)
{
    std::vector<LiveIpv6Route> routes;
    while (!text.empty()) {
        const auto field = SplitFields(TakeLine(text));
        if (field.size() != kFields || field[9] != interface)
            continue;
        const auto destination = ParseIpv6Digits(field[0]);
        const auto gateway = ParseIpv6Digits(field[4]);
        const auto length = ReadHexNumber(field[1]);
        const auto metric = ReadHexNumber(field[5]);
        const auto flags = ReadHexNumber(field[8]);
        if (!destination || !gateway || !length || *length > kIpv6Bits || !metric || !flags)
            continue;
        const bool routed = (*flags & RTF_GATEWAY) != 0;
        if ((*flags & kKernelsOwn) != 0 || (!routed && *metric == kAddressMetric) ||
            IN6_IS_ADDR_LINKLOCAL(&*destination) || IN6_IS_ADDR_MULTICAST(&*destination))
            continue;
        routes.push_back({Ipv6Text(*destination) + "/" + std::to_string(*length), routed ? Ipv6Text(*gateway) : ""});
    }
    return routes;
}

}  // namespace tavo
