// The 512-byte pages that a drive answers with.
#include "storage/detail/drive_page.h"

#include "core/detail/strict_number.h"

#include <numeric>

namespace tavo {
namespace {

constexpr size_t kFirstAttribute = 2;
constexpr size_t kAttributes = 30;
constexpr size_t kAttributeBytes = 12;
constexpr size_t kRawAt = 5;
constexpr size_t kRawBytes = 6;
constexpr int kTemperature = 194;

constexpr int kColdest = -60;
constexpr int kHottest = 200;

unsigned Word(const DrivePage &identity, size_t number)
{
    return identity[2 * number] | static_cast<unsigned>(identity[2 * number + 1]) << 8;
}

}  // namespace

bool SumIsZero(const unsigned char *page)
{
    return std::accumulate(page, page + kPageBytes, 0u) % 256 == 0;
}

std::optional<uint64_t> SmartRawValue(const DrivePage &page, int id)
{
    for (size_t slot = 0; slot < kAttributes; ++slot) {
        const unsigned char *const attribute = page.data() + kFirstAttribute + slot * kAttributeBytes;
        if (attribute[0] != id)
            continue;
        uint64_t raw = 0;
        for (size_t i = kRawBytes; i-- > 0;)
            raw = raw << 8 | attribute[kRawAt + i];
        return raw;
    }
    return std::nullopt;
}

std::string TemperatureText(uint64_t raw)
{
    return std::to_string(static_cast<int16_t>(raw));
}

std::optional<int> SmartTemperature(const DrivePage &page)
{
    const std::optional<uint64_t> raw = SmartRawValue(page, kTemperature);
    if (!raw)
        return std::nullopt;
    const int degrees = LeadingNumber<int>(TemperatureText(*raw));
    return degrees >= kColdest && degrees <= kHottest ? std::optional(degrees) : std::nullopt;
}

bool HasNoRotatingMedium(const DrivePage &identity)
{
    constexpr unsigned ata_7_and_later = 0x7F80;  // one bit per version; bits 0 and 15 are not versions
    const unsigned versions = Word(identity, 80);
    if (versions != 0xFFFF && (versions & ata_7_and_later) != 0 && Word(identity, 217) == 1)
        return true;
    if (Word(identity, 83) >> 14 != 1)
        return false;
    // Flash modules of the first generation know neither SMART nor its error log.
    return (Word(identity, 82) & 1) == 0 || (Word(identity, 84) & 1) == 0;
}

bool HasWriteCacheOn(const DrivePage &identity)
{
    return (Word(identity, 85) & 1 << 5) != 0;
}

}  // namespace tavo
