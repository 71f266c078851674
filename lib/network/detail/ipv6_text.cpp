// IPv6 addresses as text.
#include "network/detail/ipv6_text.h"

#include "core/detail/text_fields.h"

#include <charconv>

#include <arpa/inet.h>

namespace tavo {
namespace {

template <class Number>
bool ReadHex(std::string_view text, Number &value) noexcept
{
    const char *const end = text.data() + text.size();
    const auto [next, error] = std::from_chars(text.data(), end, value, 16);
    return error == std::errc() && next == end;
}

}  // namespace

std::optional<in6_addr> ParseIpv6(const char *text) noexcept
{
    in6_addr address;
    if (::inet_pton(AF_INET6, text, &address) != 1)
        return std::nullopt;
    return address;
}

std::string Ipv6Text(const in6_addr &address)
{
    char text[INET6_ADDRSTRLEN] = "";
    ::inet_ntop(AF_INET6, &address, text, sizeof text);
    return text;
}

bool IsHostAddress(const in6_addr &address) noexcept
{
    return !IN6_IS_ADDR_UNSPECIFIED(&address) && !IN6_IS_ADDR_MULTICAST(&address);
}

bool IsNetwork(const in6_addr &address, int length) noexcept
{
    for (int bit = length; bit < kIpv6Bits; ++bit) {
        if (address.s6_addr[bit / 8] & (0x80 >> bit % 8))
            return false;
    }
    return true;
}

std::optional<in6_addr> ParseIpv6Digits(std::string_view digits) noexcept
{
    in6_addr address;
    if (digits.size() != 2 * sizeof address.s6_addr)
        return std::nullopt;
    for (size_t i = 0; i < sizeof address.s6_addr; ++i) {
        if (!ReadHex(digits.substr(2 * i, 2), address.s6_addr[i]))
            return std::nullopt;
    }
    return address;
}

std::optional<uint32_t> ReadHexNumber(std::string_view text) noexcept
{
    uint32_t value = 0;
    return ReadHex(text, value) ? std::optional(value) : std::nullopt;
}

std::vector<std::string> ParseIpv6Table(std::string_view text, std::string_view interface)
{
    std::vector<std::string> addresses;
    while (!text.empty()) {
        const auto field = SplitFields(TakeLine(text));  // address, index, length, scope, flags, name
        if (field.size() != 6 || field[5] != interface)
            continue;
        const auto address = ParseIpv6Digits(field[0]);
        const auto length = ReadHexNumber(field[2]);
        if (address && length && *length <= kIpv6Bits)
            addresses.push_back(Ipv6Text(*address) + "/" + std::to_string(*length));
    }
    return addresses;
}

}  // namespace tavo
