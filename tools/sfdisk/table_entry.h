// One 16-byte entry of a partition table sector.
#ifndef SFDISK_TABLE_ENTRY_H
#define SFDISK_TABLE_ENTRY_H

#include <array>
#include <cstddef>
#include <cstdint>

namespace sfdisk {

inline constexpr size_t kSectorBytes = 512;
inline constexpr uint64_t kAddressableSectors = uint64_t{1} << 32;  // the reach of 32-bit sector numbers

using Sector = std::array<uint8_t, kSectorBytes>;

struct TableEntry {
    uint8_t boot = 0;
    uint8_t type = 0;
    uint64_t start = 0;  // sectors, from what the table that holds the entry counts from; an MS-DOS one has 32 bits
    uint64_t count = 0;

    bool IsEmpty() const { return count == 0; }
    bool IsExtended() const { return type == 0x05 || type == 0x0F || type == 0x85; }
    uint64_t End() const { return start + count; }
};

// Returns whether the sector carries the signature of a table.
bool HasSignature(const Sector &sector);
void SetSignature(Sector &sector);

// The entry in slot 0 to 3.
TableEntry ReadEntry(const Sector &sector, size_t slot);
void WriteEntry(Sector &sector, size_t slot, const TableEntry &entry);

}  // namespace sfdisk

#endif
