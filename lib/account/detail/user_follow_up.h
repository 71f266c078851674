// What else on the appliance knows users by name, and is brought in line after a change. Each step stands alone: the
// accounts are changed whatever comes of it.
#ifndef TAVO_ACCOUNT_DETAIL_USER_FOLLOW_UP_H
#define TAVO_ACCOUNT_DETAIL_USER_FOLLOW_UP_H

#include "account/detail/user_batch.h"
#include "core/detail/list_owner.h"

#include <span>

namespace tavo {

// Upper-case old name to new name, "" for a deleted user, as Samba's lists and the groups want it. False without memory.
bool AddNameChange(HashOwner &names, const std::string &old_name, const std::string &new_name);

// Lets the Apple file service accept or refuse guests. 0, ERR_FILE_NOT_FOUND when it has no settings, or a code of the
// rewrite.
int SetGuestAfpd(bool may_enter);

// Creates the home folder of an added user, moves that of a renamed one.
bool CreateHome(const DoneUser &user);
bool MoveHome(const std::string &old_name, const std::string &new_name);

// Moves the home folders of deleted users aside on their volume and removes them. True also when there are none.
bool RemoveHomes(std::span<const std::string> names);

}  // namespace tavo

#endif
