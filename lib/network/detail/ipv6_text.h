// IPv6 addresses as text, in the one form that the kernel's tools write.
#ifndef TAVO_NETWORK_DETAIL_IPV6_TEXT_H
#define TAVO_NETWORK_DETAIL_IPV6_TEXT_H

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <netinet/in.h>

namespace tavo {

inline constexpr int kIpv6Bits = 128;

// As inet_pton takes it; no zone, no prefix length.
std::optional<in6_addr> ParseIpv6(const char *text) noexcept;

std::string Ipv6Text(const in6_addr &address);

// An address that an interface can have: neither "::" nor a multicast one.
bool IsHostAddress(const in6_addr &address) noexcept;

// Returns whether only the first `length` bits are set.
bool IsNetwork(const in6_addr &address, int length) noexcept;

// As the kernel's tables have them: 32 hexadecimal digits without colons, and a hexadecimal number.
std::optional<in6_addr> ParseIpv6Digits(std::string_view digits) noexcept;
std::optional<uint32_t> ReadHexNumber(std::string_view text) noexcept;

// "ADDRESS/LENGTH" of every address that the interface has, from the text of /proc/net/if_inet6, in its order.
std::vector<std::string> ParseIpv6Table(std::string_view text, std::string_view interface);

}  // namespace tavo

#endif
