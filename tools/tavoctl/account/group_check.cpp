// tavoctl group check: whether files and stores say the same.
#include "account/account_check.h"
#include "account/account_key.h"
#include "account/group_record.h"
#include "account/group_verbs.h"
#include "frame/held_locks.h"
#include "frame/program.h"

#include "tavo_group.h"
#include "tavo_lock.h"

#include <fstream>
#include <set>

namespace tavoctl {
namespace {

std::set<std::string> UserKeys()
{
    std::set<std::string> keys;
    std::ifstream in("/etc/passwd");
    for (std::string line; std::getline(in, line);)
        keys.insert(AccountKey(SplitFields(line)[0]));
    return keys;
}

class GroupCheck : public Verb {
  public:
    static constexpr VerbInfo info = {
        "check", reads,
        "Compares the two files of groups with the library's stores, and names every difference, and every member that "
        "is no user; exit status 1 when there is one. Nothing is changed. A file that was edited by hand differs until "
        "the library is used the next time, and then the file counts.",
        "tavoctl group check\n"
        "tavoctl group check --json"};

    int Run(const Call &call) override
    {
        AccountCheck check({{"/etc/group", TAVO_GROUP_DB_NAME, {"name", "password", "gid", "members"}},
                            {"/etc/group_desc", TAVO_GROUP_DB_DESC, {"name", "description"}}},
                           TAVO_GROUP_DB_ID);
        const HeldLocks lock(TAVO_LOCK_USER | TAVO_LOCK_GROUP, true, usual_wait);
        check.Run();
        const std::set<std::string> users = UserKeys();
        for (const auto &[key, line] : check.Lines(0)) {
            const std::vector<std::string> fields = SplitFields(line);
            for (const std::string &member : SplitNames(fields[3]))
                if (!users.contains(AccountKey(member)))
                    check.Add(fields[0], "/etc/group", "the member " + member + " is no user");
        }
        return check.Print(call);
    }
};

}  // namespace

void AddGroupCheck(Family &group)
{
    group.Add<GroupCheck>();
}

}  // namespace tavoctl
