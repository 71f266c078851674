// Which groups an enumeration lists.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_ENUMERATION_H
#define TAVO_ACCOUNT_DETAIL_GROUP_ENUMERATION_H

#include "account/detail/user_enumeration.h"
#include "core/detail/result.h"

#include <optional>

namespace tavo {

// The names that `flags` (TAVO_GROUP_) select and the filter passes, in the order of their keys.
// 0, ERR_BAD_PARAMETERS when no flag is set, ERR_LOCK_FAILED, ERR_OPEN_FAILED, ERR_ENUM_FAILED.
Code ListGroups(int flags, const KeyFilter &wanted, std::vector<std::string> &names);

// A filter text as the keys have it; empty when no key can match.
std::optional<std::string> GroupFilterText(const char *text);

}  // namespace tavo

#endif
