// The local ports of /proc/net/tcp and /proc/net/udp.
#ifndef TAVO_NETWORK_DETAIL_SOCKET_TABLE_H
#define TAVO_NETWORK_DETAIL_SOCKET_TABLE_H

#include <optional>
#include <string_view>

namespace tavo {

// The local port of one row ("   0: 0100007F:1F90 00000000:0000 0A ..."); empty for the header and for other text.
std::optional<int> LocalPort(std::string_view row) noexcept;

}  // namespace tavo

#endif
