// Changes of accounts take the locks in one order, so that they cannot deadlock, and nothing is lost when many programs
// make them at once.
#include "tavo_lock.h"

#include "account/group/group_fixture.h"
#include "support/rounds.h"

#include <gtest/gtest.h>

#include <functional>
#include <set>
#include <sstream>

#include <dlfcn.h>
#include <sys/file.h>
#include <sys/wait.h>
#include <unistd.h>

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

int UserChange(const char *old_name, const char *new_name)
{
    TAVOUSER *user = nullptr;
    TAVOUserAlloc(&user, new_name, "x", -1, -1, "", "", "", -1, 0, "", 0);
    const int result = TAVOUserSetOne(old_name, user);
    TAVOUserFree(user);
    return result;
}

const Row rows[] = {
    {"add a user", [] { return UserChange(nullptr, "alice"); }, {"+lock_pw", "+lock_gr", "+lock_smb"}},
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
    {"delete a user",
     [] {
         const char *const names[] = {"alina"};
         return TAVOUserDelete(names, 1);
     },
     {"+lock_pw", "+lock_gr", "+lock_smb"}},
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

int UntilUnlocked(const std::function<int()> &change)
{
    int code = ERR_LOCK_FAILED;
    for (int tries = 0; tries < 20 && code == ERR_LOCK_FAILED; ++tries)
        code = change();
    return code;
}

std::set<std::string> Found(const std::string &text)
{
    std::set<std::string> names;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);)
        if (line.starts_with("w"))
            names.insert(line.substr(0, line.find(':')));
    return names;
}

// Each worker has groups of its own and one user in all of them, whom it renames meanwhile.
TEST(GroupConcurrency, WorkersAddChangeDeleteGroupsAndRenameTheirMembers)
{
    constexpr int workers = 16;
    const int steps = test::Rounds(5000 / workers);
    std::vector<pid_t> children;
    for (int worker = 0; worker < workers; ++worker) {
        children.push_back(::fork());
        if (children.back() != 0)
            continue;
        std::string user = "w" + std::to_string(worker) + "_u";
        int code = UntilUnlocked([&] { return test::AddUser(user); });
        for (int s = 0; s < steps && code == 0; ++s) {
            const std::string name = "w" + std::to_string(worker) + "_" + std::to_string(s / 5);
            const std::string next = "w" + std::to_string(worker) + "_u" + std::to_string(s);
            switch (s % 5) {
            case 0:
                code = UntilUnlocked([&] { return test::AddGroup(name, 70000 + worker * 1000 + s, {user, "admin"}); });
                break;
            case 1:
                code = UntilUnlocked([&] { return test::CodeOf(TAVOGroupDescSet(name.c_str(), "text")); });
                break;
            case 2:
                code = UntilUnlocked([&] {
                    TLIBErrSet(ERR_SUCCESS);
                    return test::CodeOf(UserChange(user.c_str(), next.c_str())) | TLIBErrGet();
                });
                user = next;
                break;
            case 3:
                code = UntilUnlocked([&] { return test::SetGroup(name.c_str(), name + "r", -1, {user}); });
                break;
            default:
                if (s % 2 == 0)
                    code = UntilUnlocked([&] { return test::DeleteGroups({(name + "r").c_str()}); });
            }
        }
        ::_exit(code / 0x100);
    }
    for (const pid_t child : children) {
        int status = 0;
        ::waitpid(child, &status, 0);
        EXPECT_EQ(WIFEXITED(status) ? WEXITSTATUS(status) * 0x100 : status, 0) << "what a worker could not do";
    }
    std::set<std::string> groups;
    std::set<std::string> users;
    for (int worker = 0; worker < workers; ++worker) {
        std::string user = "w" + std::to_string(worker) + "_u";
        for (int s = 0; s < steps; ++s) {
            const std::string name = "w" + std::to_string(worker) + "_" + std::to_string(s / 5);
            if (s % 5 == 0)
                groups.insert(name);
            else if (s % 5 == 2)
                user = "w" + std::to_string(worker) + "_u" + std::to_string(s);
            else if (s % 5 == 3)
                groups.erase(name), groups.insert(name + "r");
            else if (s % 5 == 4 && s % 2 == 0)
                groups.erase(name + "r");
        }
        users.insert(user);
    }
    ASSERT_TRUE(test::GetGroup("root"));
    EXPECT_EQ(Found(test::GroupFile()), groups);
    EXPECT_EQ(Found(test::FileText("/etc/passwd")), users);
    // Every member still exists under that name: no rename missed a group.
    for (const std::string &name : groups)
        for (const std::string &member : test::Members(*test::GetGroup(name)))
            EXPECT_TRUE(member == "admin" || users.contains(member)) << member << " in " << name;
}

}  // namespace
