// Lists of accounts: looked at as a whole, then carried out.
#ifndef TAVOCTL_ACCOUNT_PLANS_H
#define TAVOCTL_ACCOUNT_PLANS_H

#include "account/account_rows.h"
#include "account/group_record.h"
#include "account/user_record.h"
#include "frame/password.h"
#include "frame/verb.h"

namespace tavoctl {

struct GivenHashes {
    std::string name, password, lm, nt;
};

// The changes that a list of users asks for.
struct UserPlan {
    std::string path;                       // of the list
    std::vector<std::string> entries = {};  // the names of all rows, also of those that change nothing
    std::vector<UserChange> changes = {};
    std::vector<GivenHashes> hashes = {};
    std::vector<std::string> locked = {};  // new ones that cannot be used until they have a password
    int additions = 0;
};

// Checks every row and records the differences in the call; throws a Failure for a refusal. `password`: the options for
// a new user whose row has none; nullptr: the user is locked, and an empty hash is not a password.
UserPlan PlanUsers(Call &call, const std::string &path, bool update, const std::vector<AccountRow> &rows,
                   const PasswordChoice *password);

// Returns what the library refused; the others are done. Throws a Failure when nothing was changed.
EntryFailures CarryOut(const UserPlan &plan);

// Without the accounts of a domain, which its controller keeps.
std::vector<User> LocalUsers();

// The accounts as export writes them.
Table ExportedUsers(const std::vector<User> &users, bool hashes);

// The groups that are there, and what a list makes of them.
struct GroupPlan {
    std::string path;
    std::vector<std::string> entries = {};
    std::vector<std::pair<std::optional<Group>, Group>> changes = {};
};

// `member_name`: the name of a member as its account has it; throws a Failure for one that is not a user.
GroupPlan PlanGroups(Call &call, const std::string &path, bool update, const std::vector<AccountRow> &rows,
                     const std::function<std::string(const std::string &)> &member_name);
EntryFailures CarryOut(const GroupPlan &plan);

// For a plan that is done as a whole or not at all: throws the first failure, with how many there are.
void ThrowFirst(const EntryFailures &failures);

// All that the library lists, each with those of its members that are users.
std::vector<Group> AllGroups();

}  // namespace tavoctl

#endif
