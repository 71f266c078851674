// The pages of a store file, read without the database: opening that costs many times what finding one entry does, and
// looking one account up finds a handful. Nothing is kept from one use to the next, and the caller holds the lock.
#ifndef TAVO_ACCOUNT_DETAIL_BTREE_PAGES_H
#define TAVO_ACCOUNT_DETAIL_BTREE_PAGES_H

#include "core/detail/owner.h"

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include <sys/types.h>

namespace tavo {

// What the first page of a whole btree file of this machine's byte order says.
struct BtreeMeta {
    uint32_t version;
    uint32_t page_size;
    uint32_t last_page;
    uint32_t root;
    bool plain;  // no checksums, duplicates, compression or encryption
};

// Nothing for what is no such file, or shorter than its pages.
std::optional<BtreeMeta> ReadBtreeMeta(int fd, off_t size) noexcept;

class BtreePages {
  public:
    enum class Found { kYes, kNo, kAskTheDatabase };

    // False for a file that is not there, is no plain store, or of another version.
    bool Open(const char *path);

    // The value of a key. What this does not know, such as values that are longer than a page, and any damage: ask the
    // database.
    Found Find(std::string_view key, std::string &value);

  private:
    std::string_view Page(uint32_t number);  // empty when it cannot be read

    Fd fd_;
    BtreeMeta meta_ = {};
    std::map<uint32_t, std::string> pages_;
};

}  // namespace tavo

#endif
