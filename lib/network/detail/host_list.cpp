// One line of the list of discovered hosts.
#include "network/detail/host_list.h"

#include "network/detail/ipv4_text.h"

#include <array>
#include <charconv>

namespace tavo {
namespace {

constexpr size_t kFields = 5;
constexpr long kLeastProtocol = 240;
constexpr size_t kLongestName = 255;

// The number at the beginning of the field; 0 when there is none.
long LeadingNumber(std::string_view field) noexcept
{
    long number = 0;
    std::from_chars(field.data(), field.data() + field.size(), number);
    return number;
}

}  // namespace

HostLine ParseHostLine(std::string_view line) noexcept
{
    std::array<std::string_view, kFields> field;
    for (size_t i = 0; i < kFields; ++i) {
        const size_t comma = line.find(',');
        field[i] = line.substr(0, comma);
        if (comma == std::string_view::npos && i + 1 < kFields)
            return {HostLineKind::too_few_fields, {}, {}};
        line.remove_prefix(comma == std::string_view::npos ? line.size() : comma + 1);
    }
    if (LeadingNumber(field[0]) == 0)
        return {HostLineKind::no_model, {}, {}};
    if (LeadingNumber(field[1]) < kLeastProtocol)
        return {HostLineKind::other_protocol, {}, {}};
    if (!ParseIpv4(field[3]))
        return {HostLineKind::bad_address, {}, {}};
    return {HostLineKind::host, field[2].substr(0, kLongestName), field[3]};
}

}  // namespace tavo
