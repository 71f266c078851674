// IPv4 addresses and masks as text.
#include "network/detail/ipv4_text.h"

#include <bit>
#include <charconv>

namespace tavo {

uint32_t Ipv4::Word() const noexcept
{
    uint32_t word = 0;
    for (const int value : octet)
        word = word << 8 | static_cast<uint32_t>(value);
    return word;
}

Ipv4 Ipv4::FromWord(uint32_t word) noexcept
{
    Ipv4 address;
    for (int at = 3; at >= 0; --at, word >>= 8)
        address.octet[static_cast<size_t>(at)] = static_cast<int>(word & 0xFF);
    return address;
}

std::string Ipv4::Text() const
{
    std::string text;
    for (const int value : octet)
        text += (text.empty() ? "" : ".") + std::to_string(value);
    return text;
}

std::optional<Ipv4> ParseIpv4(std::string_view text) noexcept
{
    Ipv4 address;
    const char *at = text.data();
    const char *const end = at + text.size();
    for (size_t i = 0; i < 4; ++i) {
        if (i > 0 && (at == end || *at++ != '.'))
            return std::nullopt;
        unsigned value = 0;
        const auto [next, error] = std::from_chars(at, end, value);
        if (error != std::errc() || next - at > 3 || value > 255)
            return std::nullopt;
        address.octet[i] = static_cast<int>(value);
        at = next;
    }
    if (at != end)
        return std::nullopt;
    return address;
}

bool IsHostAddress(const Ipv4 &address) noexcept
{
    const int first = address.octet[0];
    return first != 0 && first != 127 && first <= 223 && address.octet[3] <= 254;
}

std::optional<int> PrefixLength(const Ipv4 &mask) noexcept
{
    const uint32_t word = mask.Word();
    const int ones = std::countl_one(word);
    if (std::popcount(word) != ones)
        return std::nullopt;
    return ones;
}

Ipv4 MaskOf(int prefix_length) noexcept
{
    return Ipv4::FromWord(prefix_length <= 0 ? 0 : ~uint32_t{0} << (32 - prefix_length));
}

std::optional<SlashPair> SplitAtSlash(std::string_view text) noexcept
{
    const size_t slash = text.find('/');
    if (slash == std::string_view::npos)
        return std::nullopt;
    const std::string_view before = text.substr(0, slash);
    text.remove_prefix(slash + 1);
    return SlashPair{before, text};
}

}  // namespace tavo
