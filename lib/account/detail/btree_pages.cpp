// Finds an entry in the pages of a store file.
#include "account/detail/btree_pages.h"

#include "core/detail/open_file.h"

#include <algorithm>
#include <bit>
#include <cstring>

#include <db_185.h>

namespace tavo {
namespace {

// The fields of the first page by their offsets.
constexpr size_t kMagicAt = 12, kVersionAt = 16, kPageSizeAt = 20, kEncryptionAt = 24, kMetaFlagsAt = 26,
                 kLastPageAt = 32, kFlagsAt = 48, kRootAt = 88, kMeta = 92;
constexpr uint8_t kBtreeMetaType = 9;
constexpr uint32_t kVersion = 9;

// Those of any other page: its own number, how many items it has, its type, and behind it where each item begins.
constexpr size_t kNumberAt = 8, kItemsAt = 20, kPageTypeAt = 25, kIndexAt = 26;
constexpr uint8_t kInternalPage = 3, kLeafPage = 5;

// An item: length, type, and its bytes, before which an inner page has the number of the page below.
constexpr size_t kItemTypeAt = 2, kLeafBytesAt = 3, kChildAt = 4, kInternalBytesAt = 12;
constexpr uint8_t kPlainItem = 1, kDeleted = 0x80;

constexpr int kDeepest = 16;

template <class Number>
Number NumberAt(std::string_view bytes, size_t at)
{
    Number number = 0;
    if (at + sizeof number <= bytes.size())
        std::memcpy(&number, bytes.data() + at, sizeof number);
    return number;
}

uint8_t PageType(std::string_view page)
{
    return NumberAt<uint8_t>(page, kPageTypeAt);
}

struct Item {
    uint8_t type = 0;  // 0: there is no such item
    uint32_t child = 0;
    std::string_view bytes;
};

Item ItemOf(std::string_view page, size_t index)
{
    const size_t at = NumberAt<uint16_t>(page, kIndexAt + index * sizeof(uint16_t));
    const size_t length = NumberAt<uint16_t>(page, at);
    const bool inner = PageType(page) == kInternalPage;
    const size_t begin = at + (inner ? kInternalBytesAt : kLeafBytesAt);
    if (at < kIndexAt || begin > page.size() || length > page.size() - begin)
        return {};
    return {NumberAt<uint8_t>(page, at + kItemTypeAt), inner ? NumberAt<uint32_t>(page, at + kChildAt) : 0,
            page.substr(begin, length)};
}

// The last of `count` items, each `step` slots apart, whose key is not greater; -1 when there is none, nothing when a
// key is not plainly there. The first key of an inner page stands for everything that is less.
std::optional<int> LastNotGreater(std::string_view page, int count, size_t step, std::string_view key)
{
    const bool inner = PageType(page) == kInternalPage;
    int low = inner ? 1 : 0;
    int high = count;
    while (low < high) {
        const int middle = low + (high - low) / 2;
        const Item item = ItemOf(page, static_cast<size_t>(middle) * step);
        if ((item.type & ~kDeleted) != kPlainItem)
            return std::nullopt;
        if (item.bytes <= key)
            low = middle + 1;
        else
            high = middle;
    }
    return low - 1;
}

}  // namespace

std::optional<BtreeMeta> ReadBtreeMeta(int fd, off_t size) noexcept
{
    char bytes[kMeta];
    if (::pread(fd, bytes, sizeof bytes, 0) != static_cast<ssize_t>(sizeof bytes))
        return std::nullopt;
    const std::string_view page(bytes, sizeof bytes);
    const BtreeMeta meta = {NumberAt<uint32_t>(page, kVersionAt), NumberAt<uint32_t>(page, kPageSizeAt),
                            NumberAt<uint32_t>(page, kLastPageAt), NumberAt<uint32_t>(page, kRootAt),
                            NumberAt<uint8_t>(page, kEncryptionAt) == 0 && NumberAt<uint8_t>(page, kMetaFlagsAt) == 0 &&
                                NumberAt<uint32_t>(page, kFlagsAt) == 0};
    if (NumberAt<uint32_t>(page, kMagicAt) != BTREEMAGIC || PageType(page) != kBtreeMetaType ||
        !std::has_single_bit(meta.page_size) || meta.page_size < 512 || meta.page_size > 65536 ||
        size < (off_t{meta.last_page} + 1) * static_cast<off_t>(meta.page_size))
        return std::nullopt;
    return meta;
}

bool BtreePages::Open(const char *path)
{
    fd_ = OpenFd(path, O_RDONLY | O_NOFOLLOW);
    struct stat st;
    if (!fd_ || ::fstat(fd_.Get(), &st) != 0 || !S_ISREG(st.st_mode))
        return false;
    const std::optional<BtreeMeta> meta = ReadBtreeMeta(fd_.Get(), st.st_size);
    if (!meta || !meta->plain || meta->version != kVersion)
        return false;
    meta_ = *meta;
    return true;
}

BtreePages::Found BtreePages::Find(std::string_view key, std::string &value)
{
    uint32_t number = meta_.root;
    for (int depth = 0; depth < kDeepest; ++depth) {
        const std::string_view page = Page(number);
        const int items = NumberAt<uint16_t>(page, kItemsAt);
        const uint8_t type = PageType(page);
        const bool leaf = type == kLeafPage;
        if ((!leaf && type != kInternalPage) || (leaf ? items % 2 != 0 : items == 0))
            return Found::kAskTheDatabase;
        const std::optional<int> place = LastNotGreater(page, leaf ? items / 2 : items, leaf ? 2 : 1, key);
        if (!place)
            return Found::kAskTheDatabase;
        if (!leaf) {
            number = ItemOf(page, static_cast<size_t>(*place)).child;
            continue;
        }
        if (*place < 0 || ItemOf(page, static_cast<size_t>(*place) * 2).bytes != key)
            return Found::kNo;
        const Item item = ItemOf(page, static_cast<size_t>(*place) * 2 + 1);
        if (item.type != kPlainItem)
            return Found::kAskTheDatabase;
        value = item.bytes;
        return Found::kYes;
    }
    return Found::kAskTheDatabase;
}

std::string_view BtreePages::Page(uint32_t number)
{
    if (const auto known = pages_.find(number); known != pages_.end())
        return known->second;
    if (number == 0 || number > meta_.last_page)
        return {};
    std::string page(meta_.page_size, '\0');
    const off_t at = off_t{number} * static_cast<off_t>(meta_.page_size);
    if (::pread(fd_.Get(), page.data(), page.size(), at) != static_cast<ssize_t>(page.size()) ||
        NumberAt<uint32_t>(page, kNumberAt) != number)
        return {};
    return pages_.emplace(number, std::move(page)).first->second;
}

}  // namespace tavo
