// The groups in the privilege lists of the shared folders: "readonly", "readwrite" and "deny" of every section of
// /usr/tavo/etc/share.conf, names between commas, groups with "@" before them.
#ifndef TAVO_ACCOUNT_DETAIL_SHARE_GROUPS_H
#define TAVO_ACCOUNT_DETAIL_SHARE_GROUPS_H

#include "core/detail/list_owner.h"
#include "core/detail/result.h"

#include <string>
#include <string_view>

namespace tavo {

// "@" and the upper-case old name to the new name, "" taking the group out. Everything else in the file is the same
// text.
std::string ChangeShareGroups(std::string_view text, const TLIBSZHASH *names);

// Makes these changes in the file. Returns 0, also when there is no file; or a code of the rewrite, the file unchanged.
Code ChangeGroupsInShares(const TLIBSZHASH *names);

}  // namespace tavo

#endif
