// A program that changes users or groups dies, at every system call. After the next change every file in which an account
// is named is the old or the new one, all of them alike: also where the first one died over what follows.
#include "tavo_group.h"
#include "tavo_user.h"

#include "account/group/group_fixture.h"
#include "support/rounds.h"
#include "support/scratch_dir.h"
#include "support/traced_call.h"

#include <gtest/gtest.h>

#include <functional>
#include <map>

#include <sys/stat.h>
#include <unistd.h>

// Hashes take their salt from the clock.
extern "C" time_t time(time_t *out) noexcept
{
    constexpr time_t now = 1700000000;
    if (out)
        *out = now;
    return now;
}

namespace {

using Files = std::map<std::string, std::string>;

constexpr const char *kFiles[] = {
    "/etc/passwd",    "/etc/shadow",         "/etc/tavouser.conf",         "/usr/tavo/etc/private/smbpasswd",
    "/etc/group",     "/etc/group_desc",     "/usr/tavo/etc/smb.conf",     "/usr/tavo/etc/share.conf",
    "/etc/ftpchroot", "/etc/rsyncd.secrets", "/usr/tavo/etc/netbkp.users", "/usr/tavo/etc/afpd.conf",
};
constexpr char kHomeFolder[] = "/var/services/homes";

// The text of every file, and who has a home with what in it.
Files Everything()
{
    Files found;
    for (const char *path : kFiles)
        found[path] = test::FileText(path);
    for (const char *folder : {kHomeFolder, "/volume1/homes"})
        for (const auto &home : std::filesystem::directory_iterator(folder))
            found[home.path()] = test::FileText((home.path() / "file").c_str());
    return found;
}

void PutBack(const Files &files)
{
    for (const char *folder : {kHomeFolder, "/volume1/homes", "/volume1/@tmp"})
        std::filesystem::remove_all(folder);
    for (const char *folder : {kHomeFolder, "/volume1/homes"})
        std::filesystem::create_directories(folder);
    for (const auto &[path, text] : files) {
        if (path.starts_with(kHomeFolder) || path.starts_with("/volume1/homes")) {
            std::filesystem::create_directories(path);
            test::WriteFile(path + "/file", text);
        } else if (test::FileText(path.c_str()) != text) {
            test::WriteFile(path, text);
        }
    }
}

void SetUsers(const std::vector<std::pair<const char *, const char *>> &changes, const char *password)
{
    std::vector<TAVOUSER *> users;
    std::vector<const char *> old_names;
    for (const auto &[old_name, name] : changes) {
        TAVOUSER *user = nullptr;
        TAVOUserAlloc(&user, name, password, -1, -1, "", "", "", -1, 0, "", 0);
        users.push_back(user);
        old_names.push_back(old_name);
    }
    TAVOUserSet(old_names.data(), users.data(), static_cast<int>(users.size()));
    for (TAVOUSER *user : users)
        TAVOUserFree(user);
}

void DeleteUsers(std::vector<const char *> names)
{
    TAVOUserDelete(names.data(), static_cast<int>(names.size()));
}

const struct Work {
    const char *name;
    std::function<void()> change;
} kWorks[] = {
    {"add",
     [] {
         SetUsers({{nullptr, "dave"}, {nullptr, "eve"}}, "new");
     }},
    {"change",
     [] {
         SetUsers({{"bob", "bob"}, {"guest", "guest"}}, "other");
     }},
    {"rename",
     [] {
         SetUsers({{"bob", "bobby"}, {"alice", "bob"}}, "other");
     }},
    {"delete",
     [] {
         DeleteUsers({"alice", "bob"});
     }},
    {"rename group",
     [] {
         test::SetGroup("staff", "crew", -1, {"alice", "bob"});
     }},
    {"delete group",
     [] {
         test::DeleteGroups({"staff"});
     }},
    {"batch",
     [] {
         SetUsers({{nullptr, "dave"}, {"alice", "robert"}, {"carol", "carol"}, {"guest", "guest"}}, "b");
     }},
};

// Accounts that every neighbour knows.
void StartKnownEverywhere()
{
    std::filesystem::create_directories("/volume1/homes");
    std::filesystem::create_directories(kHomeFolder);
    std::filesystem::create_directories("/usr/tavo/etc");
    test::WriteFile("/etc/tavoinfo.conf", "userHomeEnable=\"yes\"\n");
    test::WriteFile("/etc.defaults/tavoinfo.conf", "netbkp=\"yes\"\nmaxaccounts=\"2048\"\n");
    SetUsers({{nullptr, "alice"}, {nullptr, "bob"}, {nullptr, "carol"}}, "secret");
    ASSERT_EQ(test::AddGroup("staff", -1, {"alice", "bob", "carol"}), 0);
    ASSERT_EQ(TAVOGroupDescSet("staff", "old hands"), 0);
    test::WriteFile("/usr/tavo/etc/smb.conf", "[x]\n\tvalid users = alice,@staff,bob,carol\n\twrite list = \"bob\"\n");
    test::WriteFile("/usr/tavo/etc/share.conf",
                    "[homes]\n\tpath=\"/volume1/homes\"\n[x]\n\treadwrite=\"alice,@staff,@users\"\n");
    test::WriteFile("/etc/ftpchroot", "alice\nbob\n");
    test::WriteFile("/usr/tavo/etc/netbkp.users", "alice\nbob\ndave\n");
    test::WriteFile("/etc/rsyncd.secrets", "alice:secret\nbob:secret\n", 0600);
    test::WriteFile("/usr/tavo/etc/afpd.conf", "- -uamlist uams_guest.so\n");
    for (const char *folder : {kHomeFolder, "/volume1/homes"})
        for (const std::string name : {"alice", "bob", "carol"}) {
            std::filesystem::create_directories(std::string(folder) + "/" + name);
            test::WriteFile(std::string(folder) + "/" + name + "/file", name + "'s");
        }
}

// Any change of another account finishes what was begun; this one leaves everything as it is.
int NextChange()
{
    return TAVOGroupDescSet("users", "Every local user");
}

std::string Difference(const Files &found, const Files &wanted)
{
    std::string text;
    for (const auto &[path, content] : wanted)
        if (!found.contains(path) || found.at(path) != content)
            text += path + " has\n" + (found.contains(path) ? found.at(path) : "(nothing)") + "instead of\n" + content;
    for (const auto &[path, content] : found)
        if (!wanted.contains(path))
            text += path + " is there\n";
    return text;
}

void ExpectNothingLeft()
{
    EXPECT_NE(::access("/etc/.tavoaccount.commit", F_OK), 0);
    for (const char *path : {"/etc/passwd.tmp", "/etc/shadow.tmp", "/etc/tavouser.conf.tmp", "/etc/group_tmp",
                             "/etc/group_desc.tmp", "/usr/tavo/etc/private/smbpasswd.tmp"})
        EXPECT_NE(::access(path, F_OK), 0) << path;
    const auto scratch = std::filesystem::path("/volume1/@tmp");
    EXPECT_TRUE(!std::filesystem::exists(scratch) || std::filesystem::is_empty(scratch));
}

TEST(AccountDeath, AtEverySystemCall)
{
    if (!test::CanTrace())
        GTEST_SKIP() << "no ptrace here";
    ASSERT_NO_FATAL_FAILURE(StartKnownEverywhere());
    const Files before = Everything();
    for (const Work &work : kWorks) {
        SCOPED_TRACE(work.name);
        PutBack(before);
        ASSERT_EQ(NextChange(), 0);
        ASSERT_EQ(Difference(Everything(), before), "");
        work.change();
        const Files after = Everything();
        ASSERT_NE(before, after);
        ExpectNothingLeft();
        int calls = 0;
        int kept = 0;
        for (int n = 1;; n += std::getenv("TAVO_LONG_TESTS") ? 1 : 6 * test::Stride()) {
            PutBack(before);
            ASSERT_EQ(NextChange(), 0);
            if (!test::DiesAtCall(n, work.change))
                break;
            ++calls;
            ASSERT_EQ(NextChange(), 0) << "system call " << n;
            const Files found = Everything();
            const bool is_new = found.at("/etc/passwd") != before.at("/etc/passwd") ||
                                found.at("/etc/shadow") != before.at("/etc/shadow") ||
                                found.at("/etc/group") != before.at("/etc/group");
            kept += is_new ? 1 : 0;
            ASSERT_EQ(Difference(found, is_new ? after : before), "") << "system call " << n;
            ExpectNothingLeft();
        }
        EXPECT_GT(calls, 20 / test::Stride());
        EXPECT_GE(kept, 2 / test::Stride()) << "deaths after the point of no return";
    }
}

// A neighbour's file cannot be written: the accounts change, the result is 0, and each later change tries again.
TEST(AccountDeath, NeighboursThatFailAreTriedAgain)
{
    ASSERT_NO_FATAL_FAILURE(StartKnownEverywhere());
    const char *const blocked[] = {"/usr/tavo/etc/smb.conf.tmp", "/etc/group_tmp", "/etc/ftpchroot.tmp",
                                   "/usr/tavo/etc/netbkp.users.tmp"};
    const Files before = Everything();
    SetUsers({{"bob", "robert"}}, "secret");
    const Files after = Everything();
    for (const char *path : blocked) {
        SCOPED_TRACE(path);
        PutBack(before);
        ASSERT_EQ(NextChange(), 0);
        ASSERT_EQ(::mkdir(path, 0700), 0);
        SetUsers({{"bob", "robert"}}, "secret");
        EXPECT_EQ(test::FileText("/etc/passwd"), after.at("/etc/passwd"));
        EXPECT_NE(Everything(), after);
        // Nobody gets the old name, and with it what it may still open.
        EXPECT_EQ(test::AddUser("bob"), 0) << "of the batch";
        EXPECT_EQ(TLIBErrGet(), ERR_REMOVE_FAILED);
        EXPECT_EQ(test::FileText("/etc/passwd"), after.at("/etc/passwd"));
        EXPECT_EQ(NextChange(), 0);
        ASSERT_EQ(::rmdir(path), 0);
        ASSERT_EQ(NextChange(), 0);
        EXPECT_EQ(Difference(Everything(), after), "");
        ExpectNothingLeft();
        EXPECT_EQ(test::AddUser("bob"), 0);
        EXPECT_NE(test::FileText("/etc/passwd").find("\nbob:"), std::string::npos);
    }
    PutBack(before);
    ASSERT_EQ(::mkdir("/usr/tavo/etc/smb.conf.tmp", 0700), 0);
    ASSERT_EQ(test::DeleteGroups({"staff"}), 0);
    EXPECT_EQ(test::AddGroup("staff"), ERR_REMOVE_FAILED) << "its members would have the share of the old one";
    ::rmdir("/usr/tavo/etc/smb.conf.tmp");
    EXPECT_EQ(test::AddGroup("staff"), 0);
    EXPECT_EQ(test::FileText("/usr/tavo/etc/smb.conf").find("staff"), std::string::npos);
}

}  // namespace
