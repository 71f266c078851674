// A user as tavoctl handles one: values in place of the library's pointers.
#ifndef TAVOCTL_USER_RECORD_H
#define TAVOCTL_USER_RECORD_H

#include "frame/table.h"

#include "tavo_user.h"

#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

struct User {
    std::string name;
    std::string password;  // the stored hash, or a new one in clear text
    int uid = -1;
    int gid = -1;
    std::string description;
    std::string home;
    std::string shell;
    std::string mail;
    int expires = -1;
    bool cannot_change_password = false;
    int kind = TAVO_USER_KIND_LOCAL;
    int privilege = 0;

    // Points into this user, and lives as long as it stays as it is.
    TAVOUSER Record() const;
};

std::optional<User> FindUser(const std::string &name);  // throws a Failure when that cannot be told
User ReadUser(const std::string &name);                 // throws a Failure, also when there is none
std::optional<User> FindUserById(int uid);

// The names that the library lists, in its order; for completion too.
inline constexpr char user_help[] = "the account, in any case";
std::vector<std::string> UserNames();
std::vector<std::string> UserNames(const std::string &prefix, const std::string &part);

// One entry of a batch: an addition where there is no old name.
struct UserChange {
    std::optional<std::string> old_name;
    User user;
};

// Carries the batch through in one call of the library, and then reads every account back: the library skips an entry
// that it refuses. Throws one Failure that names those, or the reason why nothing was changed.
void SetUsers(const std::vector<UserChange> &changes, const std::string &attempted);

// The account is one of those that the system itself needs.
bool IsSystemUser(const User &user);

// "never", "" or "yyyy/mm/dd" (or with dashes), as a day number.
int ParseExpiry(const std::string &text);
Cell ExpiryCell(int day);  // not known: never
// A mask such as "0x23" or "35".
int ParsePrivilege(const std::string &text);
std::string PrivilegeText(int privilege);

}  // namespace tavoctl

#endif
