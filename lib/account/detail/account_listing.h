// Lists of the names of users or groups, as the exported functions give them.
#ifndef TAVO_ACCOUNT_DETAIL_ACCOUNT_LISTING_H
#define TAVO_ACCOUNT_DETAIL_ACCOUNT_LISTING_H

#include "tavo_list.h"

#include "account/detail/store_view.h"
#include "core/detail/where.h"

#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace tavo {

using AccountNames = std::vector<std::string>;

// Decides whether a name is listed, by its upper-case key without the NUL.
using KeyFilter = std::function<bool(std::string_view key)>;

// The names of the accounts in a store that the filter passes. `name_of` reads one from a line of the store; nothing for
// an account that is not listed. ERR_ENUM_FAILED or ERR_OUT_OF_MEMORY.
Result<AccountNames> NamesIn(StoreView &accounts, const KeyFilter &wanted,
                             const std::function<std::optional<std::string>(std::string_view line)> &name_of);

// Where the names of one kind of account come from.
struct NameSource {
    size_t key_size;
    // The names that `flags` select and the filter passes. ERR_BAD_PARAMETERS when no flag is set, ERR_LOCK_FAILED,
    // ERR_OPEN_FAILED, ERR_ENUM_FAILED.
    Result<AccountNames> (*list)(int flags, const KeyFilter &wanted);
};

// A part of a name, in any case.
struct NameSearch {
    enum class Where { beginning, anywhere };
    const char *text;
    Where where;
};

// The body of an exported function: appends the names to a caller's list, and returns their number, or -1 with the code
// at `where`. When the list cannot grow, the first names have been appended.
int EnumerateNames(TLIBSZLIST **list, const NameSource &source, int flags, const std::optional<NameSearch> &search,
                   Where where = Where());

// Their number only.
int CountNames(const NameSource &source, int flags, Where where = Where());

// Appends names to a caller's list; false when it cannot grow, with the first ones appended.
bool PushNames(TLIBSZLIST **list, const AccountNames &names);

}  // namespace tavo

#endif
