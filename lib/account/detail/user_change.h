// Prepares the entries of an account that is added or changed.
#ifndef TAVO_ACCOUNT_DETAIL_USER_CHANGE_H
#define TAVO_ACCOUNT_DETAIL_USER_CHANGE_H

#include "tavo_user.h"

#include "account/detail/password_hash.h"
#include "core/detail/result.h"

#include <ctime>
#include <string>

namespace tavo {

// The complete new entries of one account, already checked: storing them cannot be refused.
struct UserChange {
    std::string old_key;   // of the account that is replaced; empty when one is added
    std::string old_name;  // as it was
    int32_t old_uid = -1;
    std::string old_hash;
    bool keep_index = false;  // root and admin keep the index entry that they have
    std::string key;
    int32_t uid = -1;
    bool new_password = false;
    std::string passwd_line;
    std::string misc_line;
    std::string shadow_line;
    std::string smb_line;
};

// How a new password is hashed.
struct Hashing {
    time_t now = 0;
    HashMethod method = HashMethod::md5;
};

// Refuses with one of the codes of TAVOUserSet's entries; changes nothing.
Code PrepareUser(const TAVOUSERDB &db, const char *old_name, const TAVOUSER &user, const Hashing &hashing,
                 UserChange &change);

}  // namespace tavo

#endif
