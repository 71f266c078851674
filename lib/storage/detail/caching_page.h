// The caching mode page of a SCSI disk: whether its write cache is on.
#ifndef TAVO_STORAGE_DETAIL_CACHING_PAGE_H
#define TAVO_STORAGE_DETAIL_CACHING_PAGE_H

#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace tavo {

// Returns the offset of the page in the answer to MODE SENSE(6); empty when the page is missing or incomplete.
std::optional<size_t> FindCachingPage(std::span<const uint8_t> mode_data);

struct CachingPage {
    std::vector<uint8_t> mode_data;  // the whole answer, up to the end of the page
    size_t page;                     // offset of the page

    bool IsOn() const;
};

// Empty when the disk gives none.
std::optional<CachingPage> ReadCachingPage(int fd);

// Writes the page back with the bit changed.
bool WriteCachingPage(int fd, CachingPage page, bool on);

}  // namespace tavo

#endif
