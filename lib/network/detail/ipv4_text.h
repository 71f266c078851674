// IPv4 addresses and masks as text: four numbers of one to three digits each, dotted, and nothing around them.
#ifndef TAVO_NETWORK_DETAIL_IPV4_TEXT_H
#define TAVO_NETWORK_DETAIL_IPV4_TEXT_H

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace tavo {

struct Ipv4 {
    std::array<int, 4> octet{};  // each 0 to 255

    bool operator==(const Ipv4 &) const noexcept = default;
    uint32_t Word() const noexcept;  // first octet highest
    static Ipv4 FromWord(uint32_t word) noexcept;
    std::string Text() const;
};

std::optional<Ipv4> ParseIpv4(std::string_view text) noexcept;

// Returns whether a host can have it: the first number is 1 to 223 but not 127. A last one of 255 is taken for a
// broadcast whatever the mask says, because the web pages know no mask at this point.
bool IsHostAddress(const Ipv4 &address) noexcept;

// The number of leading one bits; empty when ones follow a zero.
std::optional<int> PrefixLength(const Ipv4 &mask) noexcept;

Ipv4 MaskOf(int prefix_length) noexcept;

// The texts before and after the first slash; empty without one.
struct SlashPair {
    std::string_view before;
    std::string_view after;
};
std::optional<SlashPair> SplitAtSlash(std::string_view text) noexcept;

}  // namespace tavo

#endif
