// One line of the list of discovered hosts.
#include "network/detail/host_list.h"

#include "core/detail/strict_number.h"
#include "core/detail/text_fields.h"
#include "network/detail/ipv4_text.h"
#include "network/detail/net_buffer.h"

#include <array>

namespace tavo {
namespace {

constexpr size_t kFields = 5;
constexpr long kLeastProtocol = 240;
constexpr size_t kLongestName = 255;

using Fields = std::array<std::string_view, kFields>;

// False when there are fewer; text after the last one is left out.
bool Split(std::string_view line, Fields &field) noexcept
{
    for (size_t i = 0; i < kFields; ++i) {
        if (i + 1 < kFields && line.find(',') == line.npos)
            return false;
        field[i] = TakeUntil(line, ',');
    }
    return true;
}

}  // namespace

HostLine ParseHostLine(std::string_view line) noexcept
{
    Fields field;
    if (!Split(line, field))
        return {HostLineKind::too_few_fields, {}, {}};
    if (LeadingNumber<long>(field[0]) == 0)
        return {HostLineKind::no_model, {}, {}};
    if (LeadingNumber<long>(field[1]) < kLeastProtocol)
        return {HostLineKind::other_protocol, {}, {}};
    if (!ParseIpv4(field[3]))
        return {HostLineKind::bad_address, {}, {}};
    return {HostLineKind::host, field[2].substr(0, kLongestName), field[3]};
}

std::optional<TAVOFHOST> ParseHost(std::string_view line) noexcept
{
    Fields field;
    if (ParseHostLine(line).kind != HostLineKind::host || !Split(line, field))
        return std::nullopt;
    TAVOFHOST host = {};
    host.nModel = static_cast<uint32_t>(LeadingNumber<long>(field[0]));
    host.nProtocol = static_cast<uint32_t>(LeadingNumber<long>(field[1]));
    if (field[2].empty() || !ToBuffer(field[2], host.szName, sizeof host.szName) ||
        !ToBuffer(field[3], host.szIp, sizeof host.szIp) ||
        !ToBuffer(field[4], host.szInterface, sizeof host.szInterface))
        return std::nullopt;
    return host;
}

}  // namespace tavo
