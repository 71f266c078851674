// The index of accounts by id, and the id that is handed out next. Users and groups have one each.
#ifndef TAVO_ACCOUNT_DETAIL_ID_INDEX_H
#define TAVO_ACCOUNT_DETAIL_ID_INDEX_H

#include "account/detail/btree.h"

namespace tavo {

// Six digits and a NUL, so that the order of the keys is the order of the ids.
std::string IdKey(int32_t id);

struct IdRange {
    std::string_view current_key;  // where the last id handed out is kept
    int32_t first;
    int32_t last;
    int full;  // the code when every id is taken
};

// The next free id behind the one handed out last, round the end of the range. 0, ERR_DB_CURSOR or range.full.
int FindFreeId(Btree &index, const IdRange &range, int32_t &id);

}  // namespace tavo

#endif
