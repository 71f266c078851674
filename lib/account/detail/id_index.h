// The index of accounts by id, and the next id to assign. Users and groups have one each.
#ifndef TAVO_ACCOUNT_DETAIL_ID_INDEX_H
#define TAVO_ACCOUNT_DETAIL_ID_INDEX_H

#include "account/detail/btree.h"
#include "core/detail/result.h"

namespace tavo {

// Six digits and a NUL, so that the order of the keys is the order of the ids.
std::string IdKey(int32_t id);

// Of accounts that share an id one has the index entry.
bool HasIndex(Btree &index, int32_t id, std::string_view key);

// The key of the account with that id, also of one that shares it with another or has lost its entry with that one.
// ERR_KEY_NOT_FOUND or a code of the stores.
Result<std::string> FindKeyById(const StoreView &index, StoreView &names, int32_t id,
                                bool (*has_id)(std::string_view line, int32_t id));

struct IdRange {
    std::string_view current_key;  // holds the id assigned last
    int32_t first;
    int32_t last;
    int full;  // the code when every id is taken
};

// Reads the id assigned last, for the first line of a text file. Without a record of it `id` stays unchanged. Returns 0
// or a code of the store.
Code ReadLastId(const Btree &index, std::string_view current_key, int32_t &id);

// Finds the next free id after the one assigned last, and then from the beginning of the range. Returns 0,
// ERR_DB_CURSOR, ERR_OUT_OF_MEMORY or range.full.
Code FindFreeId(Btree &index, const IdRange &range, int32_t &id);

}  // namespace tavo

#endif
