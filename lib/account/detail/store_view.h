// A store as look-ups read it: the btree file, or, for a program without root's rights, the same entries made from the
// text files.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_VIEW_H
#define TAVO_ACCOUNT_DETAIL_STORE_VIEW_H

#include "tavo_error.h"

#include <string_view>

namespace tavo {

enum class Entry { first, next };

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

// A store that cannot be read says nothing about what is in it: 0 when the key is absent, `present` when it is there,
// else the code of the failure.
inline int RequireAbsent(const StoreView &store, std::string_view key, int present)
{
    std::string_view value;
    const int code = store.Get(key, value);
    return code == 0 ? present : code == ERR_KEY_NOT_FOUND ? 0 : code;
}

// An absent line leaves the record unchanged.
template <class Line>
int ReadOptional(const StoreView &store, std::string_view key, int (*parse)(std::string_view, Line &), Line &line)
{
    std::string_view value;
    const int code = store.Get(key, value);
    return code == 0 ? parse(value, line) : code == ERR_KEY_NOT_FOUND ? 0 : code;
}

}  // namespace tavo

#endif
