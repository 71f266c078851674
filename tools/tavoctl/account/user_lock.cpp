// tavoctl user: who gets in, and how long a password is valid.
#include "account/password_ages.h"
#include "account/user_verbs.h"

namespace tavoctl {
namespace {

// The future state of the account, by the library's rule: a hash without its "!", or with one.
std::string StateAfter(const User &user, bool locked, const std::string &attempted)
{
    if (locked)
        return "locked";
    const std::size_t hash = user.password.find_first_not_of('!');
    RefuseIf(hash == std::string::npos || user.password[hash] == '*', attempted, "there is no password to go back to",
             "tavoctl user passwd sets one");
    return PasswordState(user.password.substr(hash));
}

}  // namespace

template <bool locked>
Action UserLock(Arguments &in)
{
    const auto names = in.Texts("NAME", user_kind, user_help);
    const auto system = in.Flag("--system", "also a user that the system needs");
    return [=](Call &call) {
        const auto attempted = [&](const std::string &name) {
            return std::string(locked ? "lock" : "unlock") + " the user " + name;
        };
        for (const std::string &name : *names) {
            const User user = ReadUser(name);
            RefuseIf(IsSystemUser(user) && !*system, attempted(name), "the system needs it", "--system does it anyway");
            const std::string samba = SambaState(user.name);
            call.BeginEntry("user " + user.name);
            call.Change("user " + user.name, "password", PasswordState(user.password),
                        StateAfter(user, locked, attempted(name)));
            call.Change("user " + user.name, "samba", samba, samba == "none" ? "none" : locked ? "disabled" : "on");
        }
        if (!call.Proceed())
            return;
        for (const std::string &name : *names)
            if (TAVOUserLockSet(name.c_str(), locked) != 0)
                call.FailEntry("user " + ReadUser(name).name, LibraryFailure(attempted(name)));
    };
}

template Action UserLock<true>(Arguments &in);
template Action UserLock<false>(Arguments &in);

Action UserAging(Arguments &in)
{
    constexpr int most_days = 99999;
    const auto name = in.Text("NAME", user_kind, user_help);
    const auto least = in.Number("--min", "DAYS", "days before the password may be changed again (0)", 0, most_days);
    const auto most = in.Number("--max", "DAYS", "days after which it must be changed (99999: never)", 0, most_days);
    const auto warning = in.Number("--warn", "DAYS", "days before that on which the user is warned (7)", 0, most_days);
    return [=](Call &call) {
        const std::string attempted = "set the age of the password of " + *name;
        const User user = ReadUser(*name);
        RefuseIf(!*least && !*most && !*warning, attempted, "nothing to change was given");
        RefuseIf(user.cannot_change_password && (*least || *most), attempted, "this password is fixed",
                 "tavoctl user modify --cannot-change-password no");
        const PasswordAges before = AgesOf(user.name);
        const auto change = [&](const char *column, std::optional<int> old, const std::optional<int64_t> &days) {
            if (days)
                call.Change("user " + user.name, column, old, *days);
        };
        change("min_days", before.least, *least);
        change("max_days", before.most, *most);
        change("warn_days", before.warning, *warning);
        RefuseIf(!user.cannot_change_password &&
                     most->value_or(before.most.value_or(most_days)) <= least->value_or(before.least.value_or(0)),
                 attempted, "the password could never be changed",
                 "--max must be above --min; tavoctl user modify --cannot-change-password yes fixes it");
        if (!call.Proceed())
            return;
        const auto days = [](const std::optional<int64_t> &given) { return static_cast<int>(given.value_or(-1)); };
        Must(TAVOUserAgingSet(name->c_str(), days(*least), days(*most), days(*warning)) == 0, attempted);
    };
}

}  // namespace tavoctl
