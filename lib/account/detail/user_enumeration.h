// Which accounts an enumeration lists.
#ifndef TAVO_ACCOUNT_DETAIL_USER_ENUMERATION_H
#define TAVO_ACCOUNT_DETAIL_USER_ENUMERATION_H

#include "tavo_list.h"

#include "core/detail/result.h"

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace tavo {

// Decides whether a name is listed, by its upper-case key without the NUL.
using KeyFilter = std::function<bool(std::string_view key)>;

// The names that `flags` (TAVO_USER_) select and the filter passes, in the order in which they are to be listed.
// 0, ERR_BAD_PARAMETERS when no flag is set, ERR_LOCK_FAILED, ERR_OPEN_FAILED, ERR_ENUM_FAILED.
Code ListUsers(int flags, const KeyFilter &wanted, std::vector<std::string> &names);

// Appends them to a caller's list; false when it cannot grow, with the first ones appended.
bool PushNames(TLIBSZLIST **list, const std::vector<std::string> &names);

}  // namespace tavo

#endif
