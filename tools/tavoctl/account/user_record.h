// A user as tavoctl handles one: values in place of the library's pointers.
#ifndef TAVOCTL_USER_RECORD_H
#define TAVOCTL_USER_RECORD_H

#include "tavo_user.h"

#include "account/account_rules.h"
#include "account/password_ages.h"
#include "frame/arguments.h"
#include "frame/column.h"

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

    // Points into this user, and is valid until the user changes.
    TAVOUSER Record() const;
};

std::optional<User> FindUser(const std::string &name);  // throws a Failure when the look-up fails
User ReadUser(const std::string &name);                 // throws a Failure, also when there is none
std::optional<User> FindUserById(int uid);

inline constexpr char user_help[] = "the account, in any case";

// The names that the library lists, in its order; for completion too.
std::vector<std::string> UserNames();
std::vector<std::string> UserNames(const std::string &prefix, const std::string &part);

// One entry of a batch: an addition where there is no old name.
struct UserChange {
    std::optional<std::string> old_name;
    User user;
};

// Carries the batch through in one call of the library, and then reads every account back: the library skips an entry
// that it refuses. Returns those, by their (new) names. Throws a Failure when nothing was changed.
EntryFailures SetUsers(const std::vector<UserChange> &changes, const std::string &attempted);

// The same for a single account; throws a Failure also when it is refused.
void SetUser(const std::optional<std::string> &old_name, const User &user, const std::string &attempted);

// The account is one of those that the system itself needs.
bool IsSystemUser(const User &user);

// "never", "" or "yyyy-mm-dd" (or with slashes), as a day number.
int ParseExpiry(const std::string &text);
std::optional<std::string> ExpiryText(int day);  // nothing: never
// A mask such as "0x23" or "35".
int ParsePrivilege(const std::string &text);
std::string PrivilegeText(int privilege);

std::vector<std::string> GroupsOf(const std::string &user);
const char *PasswordState(const std::string &hash);  // "set", "none" or "locked"

// An id that the library has not chosen yet is not known.
inline std::optional<uint32_t> ChosenId(int id)
{
    return id == -1 ? std::nullopt : std::optional(Id(id));
}

inline constexpr Column<User> user_columns[] = {
    {"name", field<&User::name>},
    {"kind", [](const User &u) -> std::string { return u.kind == TAVO_USER_KIND_DOMAIN ? "domain" : "local"; },
     "local or domain", in_details},
    {"uid", [](const User &u) { return ChosenId(u.uid); }, "user id"},
    {"gid", [](const User &u) { return Id(u.gid == -1 ? TAVO_USER_GID_DEFAULT : u.gid); }, "id of the primary group"},
    {"description", field<&User::description>},
    {"home", [](const User &u) { return Maybe(u.home); }, "home folder", in_details},
    {"shell", [](const User &u) { return Maybe(u.shell); }, "login shell", in_details},
    {"mail", field<&User::mail>},
    {"privilege", [](const User &u) { return PrivilegeText(u.privilege); }, "a mask, hexadecimal", in_details},
    {"password", [](const User &u) -> std::string { return PasswordState(u.password); }, "set, none or locked",
     in_details},
    {"cannot_change_password", field<&User::cannot_change_password>, "", in_details},
    {"expires", [](const User &u) { return ExpiryText(u.expires); }, "the last day, yyyy-mm-dd; null: never"},
    {"expired", [](const User &u) { return TAVOUserIsExpired(u.expires) == 1; }},
    {"min_days", [](const User &u) { return AgesOf(u.name).least; }, "before the password may be changed again",
     in_one},
    {"max_days", [](const User &u) { return AgesOf(u.name).most; }, "after which it must be changed", in_one},
    {"warn_days", [](const User &u) { return AgesOf(u.name).warning; }, "before that on which the user is warned",
     in_one},
    {"groups", [](const User &u) { return GroupsOf(u.name); }, "the groups that it is a member of", in_one},
};

extern const ArgumentKind user_kind;       // one that is there
extern const ArgumentKind new_user_kind;   // a name for one
extern const ArgumentKind date_kind;       // of the last day
extern const ArgumentKind privilege_kind;  // a mask

}  // namespace tavoctl

#endif
