// What a look-up sees of a store: the btree file, or, for a program without root's rights, the same entries made from the
// text files.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_VIEW_H
#define TAVO_ACCOUNT_DETAIL_STORE_VIEW_H

#include <string_view>

namespace tavo {

enum class Entry { kFirst, kNext };

class StoreView {
  public:
    StoreView() = default;
    virtual ~StoreView() = default;
    StoreView(const StoreView &) = delete;
    StoreView &operator=(const StoreView &) = delete;

    // The views stay valid until the next call. Absent: ERR_KEY_NOT_FOUND.
    virtual int Get(std::string_view key, std::string_view &value) const = 0;

    // The entries in the order of their keys, without the reserved ones. Past the end: ERR_DB_END.
    virtual int Walk(Entry which, std::string_view &key, std::string_view &value) = 0;
};

}  // namespace tavo

#endif
