// The 512-byte pages that a drive answers with: SMART data and identification.
#ifndef TAVO_STORAGE_DETAIL_DRIVE_PAGE_H
#define TAVO_STORAGE_DETAIL_DRIVE_PAGE_H

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

namespace tavo {

inline constexpr size_t kPageBytes = 512;
using DrivePage = std::array<unsigned char, kPageBytes>;

// The bytes of every SMART page with a checksum sum to 0.
bool SumIsZero(const unsigned char *page);

// The six raw bytes of the first attribute with that id; empty without one.
std::optional<uint64_t> SmartRawValue(const DrivePage &page, int id);

// The decimal text of a raw temperature. Drives pack the lowest and highest ones into the upper bytes: only the low 16
// bits are the reading.
std::string TemperatureText(uint64_t raw);

// Attribute 194 as degrees Celsius; empty without one, and for a reading that no disk survives.
std::optional<int> SmartTemperature(const DrivePage &page);

// From the identification.
bool HasNoRotatingMedium(const DrivePage &identity);
bool HasWriteCacheOn(const DrivePage &identity);

}  // namespace tavo

#endif
