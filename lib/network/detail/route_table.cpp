// The kernel's IPv4 routes, as /proc/net/route lists them.
#include "network/detail/route_table.h"

#include "core/detail/strict_number.h"
#include "core/detail/text_fields.h"

#include <arpa/inet.h>
#include <net/route.h>

namespace tavo {
namespace {

constexpr std::string_view kHeader[] = {"Iface",  "Destination", "Gateway", "Flags",  "RefCnt", "Use",
                                        "Metric", "Mask",        "MTU",     "Window", "IRTT"};
constexpr size_t kFields = std::size(kHeader);

// The table shows an address as the word that it is in memory: first octet lowest on the processors that we run on.
std::optional<Ipv4> ReadAddress(std::string_view text)
{
    const auto word = StrictNumber<uint32_t>(text, 16);
    if (!word)
        return std::nullopt;
    return Ipv4::FromWord(ntohl(*word));
}

}  // namespace

bool Route::IsDefault() const noexcept
{
    return destination.Word() == 0 && mask.Word() == 0 && (flags & RTF_UP) && (flags & RTF_GATEWAY);
}

std::optional<std::vector<Route>> ParseRouteTable(std::string_view text)
{
    const auto header = SplitFields(TakeLine(text));
    if (!std::equal(header.begin(), header.end(), std::begin(kHeader), std::end(kHeader)))
        return std::nullopt;

    std::vector<Route> routes;
    while (!text.empty()) {
        const auto field = SplitFields(TakeLine(text));
        if (field.size() != kFields)
            continue;
        const auto destination = ReadAddress(field[1]);
        const auto gateway = ReadAddress(field[2]);
        const auto flags = StrictNumber<uint32_t>(field[3], 16);
        const auto metric = StrictNumber<uint32_t>(field[6], 10);
        const auto mask = ReadAddress(field[7]);
        if (destination && gateway && flags && metric && mask)
            routes.push_back({std::string(field[0]), *destination, *gateway, *mask, *flags, *metric});
    }
    return routes;
}

}  // namespace tavo
