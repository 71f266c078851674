// The discovery packets: queries and replies.
#include "packet.h"

#include "tavo_fhost.h"

#include <algorithm>
#include <cstring>
#include <iterator>
#include <optional>

namespace findhostd {
namespace {

// After the header come records: a type, a length, that many bytes. Types that are not listed here are skipped.
enum Record : uint8_t {
    record_old_query = 0x00,  // empty
    record_kind = 0x01,
    record_model = 0x10,
    record_protocol = 0x11,
    record_name = 0x12,
    record_address = 0x13,
};

constexpr uint32_t kKindQuery = 1;
constexpr uint32_t kKindReply = 2;

// Numbers are little-endian, as in the queries.
uint32_t ReadNumber(const uint8_t *bytes) noexcept
{
    return uint32_t{bytes[0]} | uint32_t{bytes[1]} << 8 | uint32_t{bytes[2]} << 16 | uint32_t{bytes[3]} << 24;
}

struct Found {
    bool old_query = false;
    uint32_t kind = 0;
    unsigned seen = 0;  // a bit for each of the types 0x10 to 0x13
    Host host{};
};

bool TakeNumber(std::span<const uint8_t> value, uint32_t &number) noexcept
{
    if (value.size() != 4)
        return false;
    number = ReadNumber(value.data());
    return true;
}

bool TakeName(std::span<const uint8_t> value, Host &host) noexcept
{
    if (!IsHostName({reinterpret_cast<const char *>(value.data()), value.size()}))
        return false;
    std::memcpy(host.name, value.data(), value.size());
    return true;
}

bool TakeAddress(std::span<const uint8_t> value, Host &host) noexcept
{
    if (value.size() != sizeof host.address)
        return false;
    std::memcpy(&host.address, value.data(), sizeof host.address);
    return true;
}

// False for a record that is not what its type says, or is there a second time.
bool TakeRecord(uint8_t type, std::span<const uint8_t> value, Found &found) noexcept
{
    if (type >= record_model && type <= record_address) {
        const unsigned bit = 1u << (type - record_model);
        if (found.seen & bit)
            return false;
        found.seen |= bit;
    }
    switch (type) {
    case record_old_query:
        found.old_query = true;
        return value.empty();
    case record_kind:
        return found.kind == 0 && TakeNumber(value, found.kind) && found.kind != 0;
    case record_model:
        return TakeNumber(value, found.host.model);
    case record_protocol:
        return TakeNumber(value, found.host.protocol);
    case record_name:
        return TakeName(value, found.host);
    case record_address:
        return TakeAddress(value, found.host);
    default:
        return true;
    }
}

class Writer {
  public:
    explicit Writer(std::array<uint8_t, kLargestPacket> &packet) : packet_(packet) {}

    void Bytes(const void *bytes, size_t size)
    {
        std::memcpy(packet_.data() + size_, bytes, size);
        size_ += size;
    }
    void Put(uint8_t type, const void *value, size_t size)
    {
        const uint8_t head[] = {type, static_cast<uint8_t>(size)};
        Bytes(head, sizeof head);
        Bytes(value, size);
    }
    void Put(uint8_t type, uint32_t number)
    {
        const uint8_t bytes[] = {static_cast<uint8_t>(number), static_cast<uint8_t>(number >> 8),
                                 static_cast<uint8_t>(number >> 16), static_cast<uint8_t>(number >> 24)};
        Put(type, bytes, sizeof bytes);
    }
    size_t Size() const { return size_; }

  private:
    std::array<uint8_t, kLargestPacket> &packet_;
    size_t size_ = 0;
};

// The next character of UTF-8 text, in its one shortest form; empty where the text is not UTF-8.
std::optional<char32_t> TakeCharacter(std::string_view &text) noexcept
{
    const auto first = static_cast<unsigned char>(text.front());
    const size_t length = first < 0x80 ? 1 : first >> 5 == 6 ? 2 : first >> 4 == 14 ? 3 : first >> 3 == 30 ? 4 : 0;
    if (length == 0 || text.size() < length)
        return std::nullopt;
    char32_t character = length == 1 ? first : first & (0x7Fu >> length);
    for (const char byte : text.substr(1, length - 1)) {
        if ((static_cast<unsigned char>(byte) & 0xC0) != 0x80)
            return std::nullopt;
        character = character << 6 | (static_cast<unsigned char>(byte) & 0x3Fu);
    }
    constexpr char32_t least[] = {0, 0x80, 0x800, 0x10000};
    if (character < least[length - 1] || character > 0x10FFFF || (character >= 0xD800 && character <= 0xDFFF))
        return std::nullopt;
    text.remove_prefix(length);
    return character;
}

// Neither what steers a terminal, nor what turns the direction of the text around it, nor what the list and its readers
// put around names: commas, and parentheses around the address.
bool MayBeInName(char32_t character) noexcept
{
    if (character < 0x20 || (character >= 0x7F && character <= 0x9F))
        return false;
    if ((character >= 0x200E && character <= 0x200F) || (character >= 0x2028 && character <= 0x202E) ||
        (character >= 0x2066 && character <= 0x2069) || character == 0x061C)
        return false;
    return character != ',' && character != '(' && character != ')';
}

// All records together are far from filling a packet.
static_assert(sizeof stFHOSTHeader + 3 * 6 + 6 + 2 + kLongestName <= kLargestPacket);

}  // namespace

bool IsHostName(std::string_view name) noexcept
{
    if (name.empty() || name.size() > kLongestName || name.front() == ' ' || name.back() == ' ')
        return false;
    while (!name.empty()) {
        const auto character = TakeCharacter(name);
        if (!character || !MayBeInName(*character))
            return false;
    }
    return true;
}

bool IsSound(const Host &host) noexcept
{
    const char *const end = std::find(host.name, std::end(host.name), '\0');
    const uint32_t address = ntohl(host.address.s_addr);
    const uint32_t first = address >> 24;
    return host.model != 0 && host.protocol >= kProtocol && end != std::end(host.name) &&
           IsHostName({host.name, static_cast<size_t>(end - host.name)}) && first != 0 && first != 127 && first <= 223;
}

PacketKind ReadPacket(std::span<const uint8_t> packet, Host &host) noexcept
{
    if (packet.size() > kLargestPacket || packet.size() < sizeof stFHOSTHeader ||
        std::memcmp(packet.data(), stFHOSTHeader, sizeof stFHOSTHeader) != 0)
        return PacketKind::other;
    Found found;
    for (auto rest = packet.subspan(sizeof stFHOSTHeader); !rest.empty();) {
        if (rest.size() < 2 || rest.size() - 2 < rest[1] || !TakeRecord(rest[0], rest.subspan(2, rest[1]), found))
            return PacketKind::other;
        rest = rest.subspan(size_t{2} + rest[1]);
    }
    if (found.kind == kKindQuery || (found.kind == 0 && found.old_query))
        return PacketKind::query;
    if (found.kind != kKindReply || found.seen != 0xF || !IsSound(found.host))
        return PacketKind::other;
    host = found.host;
    return PacketKind::reply;
}

size_t WriteReply(const Host &host, std::array<uint8_t, kLargestPacket> &packet) noexcept
{
    Writer writer(packet);
    writer.Bytes(stFHOSTHeader, sizeof stFHOSTHeader);
    writer.Put(record_kind, kKindReply);
    writer.Put(record_model, host.model);
    writer.Put(record_protocol, host.protocol);
    writer.Put(record_name, host.name, std::strlen(host.name));
    writer.Put(record_address, &host.address, sizeof host.address);
    return writer.Size();
}

}  // namespace findhostd
