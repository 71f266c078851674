// The discovery packets: queries and replies. docs/discovery.md describes the bytes.
#ifndef FINDHOSTD_PACKET_H
#define FINDHOSTD_PACKET_H

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

#include <netinet/in.h>

namespace findhostd {

inline constexpr uint16_t kPort = 9999;
inline constexpr size_t kLargestPacket = 512;
inline constexpr size_t kLongestName = 63;
inline constexpr uint32_t kProtocol = 240;  // ours, and the least that a list has room for

// An appliance as it describes itself. No pointers, because it is sent over a socket byte by byte.
struct Host {
    uint32_t model;
    uint32_t protocol;
    in_addr address;
    char name[kLongestName + 1];  // ends in a NUL; the bytes after it are 0
};

// A name that a line of the list can hold, and that a terminal can show: 1 to 63 bytes of UTF-8 without control
// characters, marks of direction, line separators, commas and parentheses, and without a blank at either end.
bool IsHostName(std::string_view name) noexcept;

// Checks that a host can be listed: a model, a protocol of 240 or more, a name, an address that a host can have.
bool IsSound(const Host &host) noexcept;

enum class PacketKind { other, query, reply };

// Returns the kind of the packet. For a reply, fills in `host`, checked; otherwise leaves it alone.
PacketKind ReadPacket(std::span<const uint8_t> packet, Host &host) noexcept;

// The reply of a sound host; returns its size.
size_t WriteReply(const Host &host, std::array<uint8_t, kLargestPacket> &packet) noexcept;

}  // namespace findhostd

#endif
