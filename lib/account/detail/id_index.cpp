// The index of accounts by id.
#include "account/detail/id_index.h"

#include "account/detail/colon_fields.h"

#include <cstdio>

namespace tavo {
namespace {

// The id in the greatest key: without the reserved key, the next id follows it.
Code LastId(Btree &index, int32_t &id)
{
    std::string_view key;
    std::string_view value;
    index.nCursorType = TAVO_BDB_CURSOR_LAST;
    const Code code = index.Step(true, key, value);
    if (code == ERR_DB_END)
        id = 0;
    else if (code == 0)
        id = FieldNumber(key.substr(0, key.find('\0'))).value_or(0);
    return code.Renaming(ERR_DB_END, ERR_SUCCESS);
}

}  // namespace

std::string IdKey(int32_t id)
{
    char key[16];
    const int length = std::snprintf(key, sizeof key, "%06d", id);
    return {key, static_cast<size_t>(length) + 1};
}

bool HasIndex(Btree &index, int32_t id, std::string_view key)
{
    const Result<std::string_view> owner = index.Get(IdKey(id));
    return owner && *owner == key;
}

Result<std::string> FindKeyById(const StoreView &index, StoreView &names, int32_t id,
                                bool (*has_id)(std::string_view line, int32_t id))
{
    const Result<std::string_view> indexed = index.Get(IdKey(id));
    Code code = indexed.Failure();
    if (indexed) {
        const Result<std::string_view> account = names.Get(*indexed);
        if (account && has_id(*account, id))
            return std::string(*indexed);
        code = account.Failure();
    }
    if (code != 0 && code != ERR_KEY_NOT_FOUND)
        return code;
    std::string_view owner;
    std::string_view line;
    for (Entry which = Entry::first; (code = names.Walk(which, owner, line)) == 0; which = Entry::next)
        if (has_id(line, id))
            return std::string(owner);
    return code.Renaming(ERR_DB_END, ERR_KEY_NOT_FOUND);
}

Code ReadLastId(const Btree &index, std::string_view current_key, int32_t &id)
{
    int32_t last = 0;
    const Code code = index.GetNumber(current_key, last);
    if (code == 0)
        id = last;
    // One of another size is as good as none.
    return code.Renaming(ERR_KEY_NOT_FOUND, ERR_SUCCESS).Renaming(ERR_DB_CURSOR, ERR_SUCCESS);
}

Code FindFreeId(Btree &index, const IdRange &range, int32_t &id)
{
    int32_t current = 0;
    Code code = index.GetNumber(range.current_key, current);
    if (code == ERR_KEY_NOT_FOUND)
        code = LastId(index, current);
    if (code != 0)
        return code == ERR_OUT_OF_MEMORY ? code : Code(ERR_DB_CURSOR);
    const int32_t begin = current < range.first || current >= range.last ? range.first : current + 1;
    int32_t candidate = begin;
    do {
        code = RequireAbsent(index, IdKey(candidate), ERR_KEY_EXISTS);
        if (code == 0)
            id = candidate;
        if (code != ERR_KEY_EXISTS)
            return code;
        candidate = candidate == range.last ? range.first : candidate + 1;
    } while (candidate != begin);
    return range.full;
}

}  // namespace tavo
