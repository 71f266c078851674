// Renames and deletions of users in the member lists of all groups.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_MEMBERS_H
#define TAVO_ACCOUNT_DETAIL_GROUP_MEMBERS_H

#include "account/detail/account_session.h"
#include "core/detail/result.h"

#include <functional>
#include <string>

namespace tavo {

// The new name of a member, "" for one that goes, nullptr for one that stays.
using MemberChange = std::function<const char *(const std::string &member)>;

// Changes the open group stores; the seal is broken before the first change. 0 or a code of the stores; `changed` tells
// whether any group has been stored.
Code ChangeMembers(AccountSession &session, const MemberChange &change, bool &changed);

}  // namespace tavo

#endif
