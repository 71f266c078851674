// The user family as the session knows it: how its four text files become the content of its five stores.
#ifndef TAVO_ACCOUNT_DETAIL_USER_TEXTS_H
#define TAVO_ACCOUNT_DETAIL_USER_TEXTS_H

#include "account/detail/store_build.h"

#include <string_view>

namespace tavo {

struct UserTexts {
    std::string_view passwd = {};
    std::string_view shadow = {};
    std::string_view misc = {};
    std::string_view smb = {};
};

// The keys and values that adding these accounts would have stored, and those of system accounts, whose lines are kept
// as they are. Lines that are not accounts are left out; of two accounts with one user id the first has the index.
std::vector<StoreEntries> UserStoreEntries(const UserTexts &texts);

extern const AccountKind kUserKind;

}  // namespace tavo

#endif
