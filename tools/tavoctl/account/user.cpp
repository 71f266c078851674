// tavoctl user: local users.
#include "tavo_lock.h"

#include "account/account_check.h"
#include "account/account_use.h"
#include "account/user_verbs.h"
#include "families.h"
#include "frame/held_locks.h"

#include <limits>

#include <strings.h>

namespace tavoctl {

std::vector<User> UserKind::All(const std::string &prefix, const std::string &part)
{
    std::vector<User> users;
    for (const std::string &name : UserNames(prefix, part))
        if (const std::optional<User> user = FindUser(name))  // unless deleted since
            users.push_back(*user);
    return users;
}

void UserKind::RefuseDelete(const User &user, const std::string &attempted)
{
    if (::strcasecmp(user.name.c_str(), "root") == 0 || ::strcasecmp(user.name.c_str(), "admin") == 0)
        throw Failure{.attempted = attempted, .hint = "it must stay", .code = ERR_USER_DB_DELETE};
}

void UserKind::RefuseUsed(const User &user, const std::string &attempted)
{
    if (const std::string use = UseOfUser(user.name, Id(user.uid)); !use.empty())
        throw BusyFailure(attempted, "the user is " + use, "--force does it anyway");
}

namespace {

Action UserShow(Arguments &in)
{
    const auto name = in.OptionalText("NAME", user_kind, user_help);
    const auto uid = in.Number("--uid", "N", "the account with this id, in place of a name", 0,
                               std::numeric_limits<uint32_t>::max());
    return [=](Call &call) {
        RefuseIf(name->has_value() == uid->has_value(), "show a user", "give a name, or --uid");
        if (*name)
            return call.One(user_columns, ReadUser(**name));
        const std::optional<User> user = FindUserById(static_cast<int>(**uid));
        if (!user)
            throw NotFound("show the user " + std::to_string(**uid), ERR_NO_SUCH_USER);
        call.One(user_columns, *user);
    };
}

Action UserCheck(Arguments &)
{
    return [](Call &call) {
        AccountCheck check(
            {{"/etc/passwd", TAVO_USER_DB_NAME, {"name", "password", "uid", "gid", "description", "home", "shell"}},
             {"/etc/shadow",
              TAVO_USER_DB_SHADOW,
              {"name", "password", "last change", "least age", "most age", "warning", "inactive", "expiry",
               "reserved"}},
             {"/etc/tavouser.conf", TAVO_USER_DB_MISC, {"name", "privilege", "mail"}},
             {"/usr/tavo/etc/private/smbpasswd",
              TAVO_USER_DB_SMB,
              {"name", "uid", "LM hash", "NT hash", "flags", "last change", "end"}}},
            TAVO_USER_DB_UID);
        const HeldLocks lock(TAVO_LOCK_USER, true, usual_wait);
        check.Run();
        for (const auto &[key, line] : check.Lines(0))
            if (!check.Lines(1).contains(key))
                check.Add(SplitFields(line)[0], "/etc/shadow", "it is missing: no login");
        check.Print(call);
    };
}

}  // namespace

void AddUser(Program &program)
{
    Family &user = program.Add("user", "Local users");
    user.Add("list", reads, Answer::List(user_columns), AccountList<UserKind>,
             R"(Lists the accounts of people. Accounts of the system are not
listed; the guest is where the model has one.

tavoctl user list
tavoctl user list --prefix a --json)");
    user.Add("show", reads, Answer::One(user_columns), UserShow,
             R"(Shows everything about one account, but no hash: of the
password, whether it is set, none, or locked.

tavoctl user show anna
tavoctl user show --uid 1026 --json)");
    user.Add("add", changes, UserAdd, R"(Adds an account. The password is asked for, or is the first line of
standard input; an id is chosen unless one is given.

tavoctl user add anna --description "Anna Berg"
tavoctl user add guest2 --empty-password --expires 2027-01-31
pwgen 16 1 | tavoctl user add backup)");
    user.Add("modify", changes, UserModify, R"(Changes facts of an account; what is not given stays. Its name is
changed by rename, its password by passwd.

tavoctl user modify anna --mail anna@example.com
tavoctl user modify anna --description "" --privilege 0x23)");
    user.Add("rename", changes, AccountRename<UserKind>, R"(Renames an account; the new name may differ in case only.
Id, password, groups, shared folders and home folder go with it.

tavoctl user rename anna anna.berg)");
    user.Add("delete", changes | destroys, Answer::Batch(), AccountDelete<UserKind>,
             R"(Deletes accounts with their quotas, group memberships and
home folders, all in one batch. Nothing is done when one of them is not there, is logged in or has processes.

tavoctl user delete anna
tavoctl user delete --yes anna berta carla)");
    user.Add("passwd", changes, UserPasswd, R"(Sets the password of an account, also for Samba. It is asked for, or
is the first line of standard input.

tavoctl user passwd anna
tavoctl user passwd anna < /root/new-password)");
    user.Add("expire", changes, UserExpire, R"(Sets the last day of an account, which is valid through that whole
day, or takes the limit away. `user show` says whether an account has expired.

tavoctl user expire anna 2027-01-31
tavoctl user expire anna never)");
    user.Add("lock", changes, Answer::Batch(), UserLock<true>,
             R"(Locks accounts: their passwords fit no more, neither at a login nor for
Samba, and come back with unlock. Open sessions and SSH keys are not touched. A new password unlocks, too.

tavoctl user lock anna berta)");
    user.Add("unlock", changes, Answer::Batch(), UserLock<false>, R"(Unlocks accounts with the passwords that they had.

tavoctl user unlock anna)");
    user.Add("aging", changes, UserAging, R"(Sets how long a password is valid, in days; what is not given stays.
`user show` shows the numbers.

tavoctl user aging anna --max 90 --warn 14
tavoctl user aging anna --min 0 --max 99999)");
    user.Add("import", changes, Answer::Batch(), UserImport,
             R"(Adds the accounts of a list in one batch, and with --update changes
those that are there. The list is comma-separated values under a line of field names, or the JSON of export; the fields
are those of export, and password in clear text. Only name is required. Everything is looked at before anything is
changed.

tavoctl user import --dry-run users.csv
tavoctl user import --update --unknown-password users.csv
tavoctl user export --json | ssh other tavoctl user import -)");
    user.Add("export", reads, Answer::Document(user_export_columns), UserExport,
             R"(Writes the accounts of people as comma-separated
values, or as JSON, in the form that import reads. Password hashes only when asked for: who has them can log in to
Samba.

tavoctl user export > users.csv
tavoctl user export --json --hashes --output /root/users.json)");
    user.Add("check", reads, Answer::List(finding_columns), UserCheck,
             R"(Compares the four files of accounts with the library's
stores, and the files with each other, and names every difference; exit status 1 when there is one. Nothing is changed.
A file that was edited by hand differs until the library is used the next time, and then the file counts.

tavoctl user check
tavoctl user check --json)");
}

}  // namespace tavoctl
