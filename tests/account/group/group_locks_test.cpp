// Changes of accounts take the locks in one order, so that they cannot deadlock.
#include "tavo_lock.h"

#include "account/group/group_fixture.h"
#include "support/test.h"

#include <dlfcn.h>
#include <sys/file.h>

namespace {

constexpr const char *kOrder[] = {"lock_pw", "lock_gr", "lock_smb"};

// What was taken and given back, in order: "+lock_pw".
std::vector<std::string> *recorded = nullptr;

}  // namespace

// Takes the place of flock: notes which lock file it was. Temporary files are locked too, while they live.
extern "C" int flock(int fd, int operation) noexcept
{
    static const auto real = reinterpret_cast<int (*)(int, int)>(::dlsym(RTLD_NEXT, "flock"));
    const int result = real(fd, operation);
    if (recorded && result == 0) {
        std::error_code ignored;
        const auto path = std::filesystem::read_symlink("/proc/self/fd/" + std::to_string(fd), ignored);
        if (path.parent_path() == "/tmp/lock")
            recorded->push_back((operation & LOCK_UN   ? "-"
                                 : operation & LOCK_SH ? "~"
                                                       : "+") +
                                path.filename().string());
    }
    return result;
}

namespace {

struct Row {
    const char *what;
    int (*change)();
    test::Names expected;  // taken exclusively
};

int UserChange(const std::string &old_name, const std::string &new_name)
{
    return test::SetUsers({{old_name, new_name}}, "x");
}

const Row rows[] = {
    {"add a user", [] { return UserChange("", "alice"); }, {"+lock_pw", "+lock_gr", "+lock_smb"}},
    {"add a group", [] { return test::AddGroup("staff", -1, {"alice"}); }, {"+lock_pw", "+lock_gr", "+lock_smb"}},
    {"describe a group", [] { return TAVOGroupDescSet("staff", "text"); }, {"+lock_gr"}},
    {"rename a user of a group", [] { return UserChange("alice", "alina"); }, {"+lock_pw", "+lock_gr", "+lock_smb"}},
    {"rename a group",
     [] { return test::SetGroup("staff", "crew", -1, {"alina"}); },
     {"+lock_pw", "+lock_gr", "+lock_smb"}},
    {"change a password",
     [] {
         TAVOUSER user = {};
         user.szName = const_cast<char *>("alina");
         const TAVOUSER *users[] = {&user};
         const char *const hash[] = {"$1$ab$abcdefghijklmnopqrstuv"};
         const char *const samba[] = {"0123456789ABCDEF0123456789ABCDEF"};
         return TAVOUserSetPasswd(users, hash, samba, samba, 1);
     },
     {"+lock_pw"}},
    {"delete a group", [] { return test::DeleteGroups({"crew"}); }, {"+lock_gr", "+lock_smb"}},
    {"delete a user", [] { return test::DeleteUser("alina"); }, {"+lock_pw", "+lock_gr", "+lock_smb"}},
};

TEST(AccountLocks, AreTakenInOneOrder)
{
    ASSERT_TRUE(test::GetGroup("users"));
    for (const Row &row : rows) {
        std::vector<std::string> steps;
        recorded = &steps;
        EXPECT_EQ(row.change(), 0) << row.what;
        recorded = nullptr;
        std::vector<std::string> taken;
        std::set<std::string> held;
        for (const std::string &step : steps) {
            const std::string name = step.substr(1);
            if (step[0] == '-') {
                held.erase(name);
                continue;
            }
            if (step[0] == '+' && !held.contains(name))
                taken.push_back(step);
            // Locks after it in the order must not be held, unless it is held itself already.
            bool behind = false;
            for (const char *other : kOrder) {
                EXPECT_FALSE(behind && held.contains(other) && !held.contains(name))
                    << row.what << " takes " << name << " and has " << other;
                behind |= name == other;
            }
            held.insert(name);
        }
        EXPECT_EQ(taken, row.expected) << row.what;
        EXPECT_TRUE(held.empty()) << row.what;
    }
}

}  // namespace
