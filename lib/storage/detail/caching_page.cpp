// The caching mode page of a SCSI disk.
#include "storage/detail/caching_page.h"

#include "storage/detail/scsi_command.h"

namespace tavo {
namespace {

constexpr uint8_t kModeSense = 0x1A;
constexpr uint8_t kModeSelect = 0x15;
constexpr uint8_t kPageFormat = 0x10;
constexpr uint8_t kCaching = 0x08;
constexpr uint8_t kWriteCache = 1 << 2;
constexpr uint8_t kPageCode = 0x3F;
constexpr size_t kHeader = 4;
constexpr size_t kLargest = 192;

}  // namespace

std::optional<size_t> FindCachingPage(std::span<const uint8_t> mode_data)
{
    if (mode_data.size() < kHeader)
        return std::nullopt;
    const size_t page = kHeader + mode_data[3];
    if (page + 3 > mode_data.size() || (mode_data[page] & kPageCode) != kCaching || mode_data[page + 1] == 0)
        return std::nullopt;
    return page + 2 + mode_data[page + 1] <= mode_data.size() ? std::optional(page) : std::nullopt;
}

bool CachingPage::IsOn() const
{
    return (mode_data[page + 2] & kWriteCache) != 0;
}

std::optional<CachingPage> ReadCachingPage(int fd)
{
    std::vector<uint8_t> mode_data(kLargest);
    const uint8_t command[] = {kModeSense, 0, kCaching, 0, static_cast<uint8_t>(kLargest), 0};
    const ScsiAnswer answer = SendScsi(fd, command, Transfer::from_disk, mode_data);
    if (!answer.delivered || answer.status != 0)
        return std::nullopt;
    const std::optional<size_t> page = FindCachingPage(mode_data);
    if (!page)
        return std::nullopt;
    mode_data.resize(*page + 2 + mode_data[*page + 1]);
    return CachingPage{std::move(mode_data), *page};
}

bool WriteCachingPage(int fd, CachingPage page, bool on)
{
    std::vector<uint8_t> &bytes = page.mode_data;
    bytes[0] = 0;  // the length and the device's own flags are not for the way back
    bytes[2] = 0;
    bytes[page.page] = kCaching;
    uint8_t &flags = bytes[page.page + 2];
    flags = static_cast<uint8_t>(on ? flags | kWriteCache : flags & ~kWriteCache);
    const uint8_t command[] = {kModeSelect, kPageFormat, 0, 0, static_cast<uint8_t>(bytes.size()), 0};
    const ScsiAnswer answer = SendScsi(fd, command, Transfer::to_disk, bytes);
    return answer.delivered && answer.status == 0;
}

}  // namespace tavo
