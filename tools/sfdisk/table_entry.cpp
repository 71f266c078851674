// One 16-byte entry of a partition table sector.
#include "table_entry.h"

namespace sfdisk {
namespace {

constexpr size_t kFirstEntry = 446;
constexpr size_t kEntryBytes = 16;
constexpr size_t kSignature = 510;

uint32_t Load32(const uint8_t *at)
{
    return uint32_t{at[0]} | uint32_t{at[1]} << 8 | uint32_t{at[2]} << 16 | uint32_t{at[3]} << 24;
}

void Store32(uint8_t *at, uint64_t value)
{
    for (int i = 0; i < 4; ++i)
        at[i] = static_cast<uint8_t>(value >> 8 * i);
}

// Cylinder, head and sector in the geometry that every BIOS assumes; its last address for sectors beyond 8 GB.
void StoreCylinder(uint8_t *at, uint64_t sector)
{
    constexpr uint64_t heads = 255;
    constexpr uint64_t per_track = 63;
    constexpr uint64_t last_cylinder = 1023;
    uint64_t cylinder = sector / (heads * per_track);
    uint64_t head = sector / per_track % heads;
    uint64_t number = sector % per_track + 1;
    if (cylinder > last_cylinder) {
        cylinder = last_cylinder;
        head = heads - 1;
        number = per_track;
    }
    at[0] = static_cast<uint8_t>(head);
    at[1] = static_cast<uint8_t>(number | (cylinder >> 2 & 0xC0));
    at[2] = static_cast<uint8_t>(cylinder);
}

}  // namespace

bool HasSignature(const Sector &sector)
{
    return sector[kSignature] == 0x55 && sector[kSignature + 1] == 0xAA;
}

void SetSignature(Sector &sector)
{
    sector[kSignature] = 0x55;
    sector[kSignature + 1] = 0xAA;
}

TableEntry ReadEntry(const Sector &sector, size_t slot)
{
    const uint8_t *const at = sector.data() + kFirstEntry + slot * kEntryBytes;
    return {.boot = at[0], .type = at[4], .start = Load32(at + 8), .count = Load32(at + 12)};
}

void WriteEntry(Sector &sector, size_t slot, const TableEntry &entry)
{
    uint8_t *const at = sector.data() + kFirstEntry + slot * kEntryBytes;
    for (size_t i = 0; i < kEntryBytes; ++i)
        at[i] = 0;
    if (entry.IsEmpty())
        return;
    at[0] = entry.boot;
    StoreCylinder(at + 1, entry.start);
    at[4] = entry.type;
    StoreCylinder(at + 5, entry.End() - 1);
    Store32(at + 8, entry.start);
    Store32(at + 12, entry.count);
}

}  // namespace sfdisk
