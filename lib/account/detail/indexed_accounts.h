// The accounts of open stores in the order of their ids, as the text files list them. Users and groups alike.
#ifndef TAVO_ACCOUNT_DETAIL_INDEXED_ACCOUNTS_H
#define TAVO_ACCOUNT_DETAIL_INDEXED_ACCOUNTS_H

#include "account/detail/btree.h"
#include "core/detail/result.h"

#include <cstdint>
#include <vector>

namespace tavo {

struct IndexedAccount {
    std::string key;
    std::string name;
    uint32_t id;
    std::string line;  // of the file that says which accounts there are
};

struct NameAndId {
    std::string name;
    int32_t id;
};

// How the lines of a family are read.
struct AccountLines {
    Result<NameAndId> (*parse)(std::string_view line);
    const char *path;  // the text file with their lines
    size_t key_size;
};

using AccountKeys = std::set<std::string, std::less<>>;

// The text of a stored value, without its NUL.
std::string_view LineOf(std::string_view value);

// A line end inside a line would make an account of its own of what follows it.
bool IsOneLine(std::string_view line);

// Reads every account, also those that share an id with another one. ERR_FORMAT_ERROR when an entry is not an account.
Code CollectAccounts(Btree &index, Btree &names, const AccountLines &lines, AccountKeys &keys,
                     std::vector<IndexedAccount> &accounts);

// The lines of a text file that is rewritten from the stores.
struct FileReview {
    std::string lost;                  // an account that would be lost without having been deleted; empty for none
    std::vector<std::string> dropped;  // how lines begin that are not accounts and are not written again
};

FileReview ReviewFile(const Btree &names, const AccountLines &lines, const AccountKeys &kept);

}  // namespace tavo

#endif
