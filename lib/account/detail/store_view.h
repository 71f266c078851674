// A store as look-ups read it: the btree file, or, for a program without root's rights, the same entries made from the
// text files.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_VIEW_H
#define TAVO_ACCOUNT_DETAIL_STORE_VIEW_H

#include "tavo_error.h"

#include "core/detail/result.h"

#include <string_view>

namespace tavo {

enum class Entry { first, next };

class StoreView {
  public:
    StoreView() = default;
    virtual ~StoreView() = default;
    StoreView(const StoreView &) = delete;
    StoreView &operator=(const StoreView &) = delete;

    // The view stays valid until the next call. Absent: ERR_KEY_NOT_FOUND.
    virtual Result<std::string_view> Get(std::string_view key) const = 0;

    // The entries in the order of their keys, without the reserved ones. Past the end: ERR_DB_END.
    virtual Code Walk(Entry which, std::string_view &key, std::string_view &value) = 0;
};

// A store that cannot be read says nothing about what is in it: 0 when the key is absent, `present` when it is there,
// else the code of the failure.
inline Code RequireAbsent(const StoreView &store, std::string_view key, int present)
{
    const Result<std::string_view> value = store.Get(key);
    return value ? Code(present) : value.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_SUCCESS);
}

// A code of the store, of the parser, or the line of a key.
template <class Line>
Result<Line> ReadLine(const StoreView &store, std::string_view key, Result<Line> (*parse)(std::string_view))
{
    const Result<std::string_view> value = store.Get(key);
    return value ? parse(*value) : value.Failure();
}

// An absent line leaves the record unchanged.
template <class Line>
Code ReadOptional(const StoreView &store, std::string_view key, Result<Line> (*parse)(std::string_view), Line &line)
{
    Result<Line> found = ReadLine(store, key, parse);
    if (found)
        line = std::move(*found);
    return found.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_SUCCESS);
}

}  // namespace tavo

#endif
