// The local ports of /proc/net/tcp and /proc/net/udp.
#include "network/detail/socket_table.h"

#include <charconv>

namespace tavo {

std::optional<int> LocalPort(std::string_view row) noexcept
{
    constexpr std::string_view digits = "0123456789ABCDEFabcdef";
    const size_t begin = row.find_first_not_of(' ');
    const size_t number = row.find(": ");
    if (begin == std::string_view::npos || number == std::string_view::npos ||
        row.find_first_not_of("0123456789", begin) != number)
        return std::nullopt;
    row.remove_prefix(number + 2);

    // 8 digits of an IPv4 address, 32 of an IPv6 one.
    const size_t colon = row.find_first_not_of(digits);
    if (colon == 0 || colon == std::string_view::npos || colon > 64 || row[colon] != ':')
        return std::nullopt;
    const char *const end = row.data() + row.size();
    int port = 0;
    const auto [next, error] = std::from_chars(row.data() + colon + 1, end, port, 16);
    if (error != std::errc() || port < 0 || port > 0xFFFF || (next != end && *next != ' '))
        return std::nullopt;
    return port;
}

}  // namespace tavo
