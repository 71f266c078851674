// The group family as the session knows it: how its two text files become the content of its three stores.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_TEXTS_H
#define TAVO_ACCOUNT_DETAIL_GROUP_TEXTS_H

#include "account/detail/store_build.h"

namespace tavo {

// The keys and values that adding these groups would have stored, and those of the system's groups, whose lines are kept
// as they are. Lines that are not groups are left out; of two groups with one id the first has the index.
std::vector<StoreEntries> GroupStoreEntries(std::string_view groups, std::string_view descriptions);

extern const AccountKind kGroupKind;

}  // namespace tavo

#endif
