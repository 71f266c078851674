// tavoctl user check: whether files and stores say the same.
#include "account/account_check.h"
#include "account/user_verbs.h"
#include "frame/held_locks.h"
#include "frame/program.h"

#include "tavo_lock.h"
#include "tavo_user.h"

namespace tavoctl {
namespace {

class UserCheck : public Verb {
  public:
    static constexpr VerbInfo info = {
        "check", reads,
        "Compares the four files of accounts with the library's stores, and the files with each other, and names every "
        "difference; exit status 1 when there is one. Nothing is changed. A file that was edited by hand differs until "
        "the library is used the next time, and then the file counts.",
        "tavoctl user check\n"
        "tavoctl user check --json"};

    int Run(const Call &call) override
    {
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
        return check.Print(call);
    }
};

}  // namespace

void AddUserCheck(Family &user)
{
    user.Add<UserCheck>();
}

}  // namespace tavoctl
