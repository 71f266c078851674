// Rebuilds the stores of a family from its text files.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_BUILD_H
#define TAVO_ACCOUNT_DETAIL_STORE_BUILD_H

#include "tavo_error.h"

#include "account/detail/account_name.h"
#include "account/detail/store_content.h"
#include "account/detail/store_family.h"
#include "core/detail/result.h"

namespace tavo {

// An account family as the session needs to know it.
struct AccountKind {
    const StoreFamily &family;
    unsigned lock;      // the lock that guards its stores and text files
    size_t name_store;  // the places of two of its stores: that of the accounts, and the index by id
    size_t id_store;
    size_t key_size;
    std::vector<StoreEntries> (*entries)(std::span<const std::string> texts);  // of the stores, from the text files
};

inline StoreContents ContentsOf(const AccountKind &kind, size_t store)
{
    return store == kind.id_store ? StoreContents::index : StoreContents::lines;
}

// The caller's code for stores that cannot be opened or built: lack of memory or space, else ERR_OPEN_FAILED.
inline Code CodeOfStores(Code code)
{
    return code == ERR_NOT_ENOUGH_SPACE || code == ERR_OUT_OF_MEMORY ? code : Code(ERR_OPEN_FAILED);
}

// Computes the entries of the stores from the text files. False when a file exists but cannot be read.
bool ReadContent(const AccountKind &kind, StoreContent &out);

// Completes a half-done commit, reads the text files and puts new stores in place of the old ones, whatever those are;
// old ones that were root's and hold no secrets are kept as "NAME.bak". Fresh entries of domain accounts stay. The
// locks must be held exclusively. `texts` becomes what the text files looked like when they were read.
// 0, ERR_OPEN_FAILED, ERR_READ_FAILED, ERR_NOT_ENOUGH_SPACE, ERR_OUT_OF_MEMORY or ERR_RENAME_FAILED.
Code BuildStores(const AccountKind &kind, std::string &texts);

}  // namespace tavo

#endif
