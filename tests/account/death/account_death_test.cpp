// A program that changes users or groups dies, at every system call. After the next change every file in which an
// account is named is the old or the new one, all of them alike: also where the first one died over what follows.
#include "tavo_group.h"
#include "tavo_user.h"

#include "account/account_story.h"
#include "account/group/group_fixture.h"
#include "account/known_everywhere.h"
#include "support/rounds.h"
#include "support/test.h"
#include "support/traced_call.h"

// Hashes take their salt from the clock.
extern "C" time_t time(time_t *out) noexcept
{
    constexpr time_t now = 1700000000;
    if (out)
        *out = now;
    return now;
}

namespace {

using test::Difference;
using test::Everything;
using test::Files;
using test::NextChange;
using test::PutBack;
using test::SetUsers;
using test::StartKnownEverywhere;

constexpr const char *kAliceAndBob[] = {"alice", "bob"};

const struct Work {
    const char *name;
    std::function<void()> other;  // a change of something else than users
    test::Changes users;
    const char *password = "";

    int Do() const { return other ? (other(), 0) : SetUsers(users, password); }
} kWorks[] = {
    {"add", nullptr, {{"", "dave"}, {"", "eve"}}, "new"},
    {"change", nullptr, {{"bob", "bob"}, {"guest", "guest"}}, "other"},
    {"rename", nullptr, {{"bob", "bobby"}, {"alice", "bob"}}, "other"},
    {"batch", nullptr, {{"", "dave"}, {"alice", "robert"}, {"carol", "carol"}, {"guest", "guest"}}, "b"},
    {"delete", [] { TAVOUserDelete(kAliceAndBob, 2); }, {}},
    {"add group", [] { test::AddGroup("crew", -1, {"bob"}); }, {}},
    {"describe group", [] { TAVOGroupDescSet("staff", "new hands"); }, {}},
    {"rename group", [] { test::SetGroup("staff", "crew", -1, {"bob"}); }, {}},
    {"delete group", [] { test::DeleteGroups({"staff"}); }, {}},
};

void ExpectNothingLeft()
{
    EXPECT_NE(::access("/etc/.tavoaccount.commit", F_OK), 0);
    EXPECT_NE(::access("/etc/group_tmp", F_OK), 0);
    for (const char *path : test::kFiles)
        EXPECT_NE(::access((path + std::string(".tmp")).c_str(), F_OK), 0) << path;
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
        work.Do();
        const Files after = Everything();
        ASSERT_NE(before, after);
        ExpectNothingLeft();
        int calls = 0;
        int kept = 0;
        for (int n = 1;; n += std::getenv("TAVO_LONG_TESTS") ? 1 : 6 * test::Stride()) {
            PutBack(before);
            ASSERT_EQ(NextChange(), 0);
            if (!test::DiesAtCall(n, [&] { work.Do(); }))
                break;
            ++calls;
            ASSERT_EQ(NextChange(), 0) << "system call " << n;
            const Files found = Everything();
            const bool is_new = found != before;
            kept += is_new ? 1 : 0;
            ASSERT_EQ(Difference(found, is_new ? after : before), "") << "system call " << n;
            ExpectNothingLeft();
        }
        EXPECT_GT(calls, 20 / test::Stride());
        EXPECT_GE(kept, 2 / test::Stride()) << "deaths after the point of no return";
    }
}

using Neighbours = test::AccountStory;

// Something of a neighbour's cannot be written: the accounts change, the result is 0, and each later change tries again. A
// new account cannot get the old name, and with it rights that still exist.
TEST_F(Neighbours, ThatFailAreTriedAgain)
{
    ASSERT_NO_FATAL_FAILURE(StartKnownEverywhere());
    const Files before = Everything();
    const auto add_bob = [] {
        return test::AddUser("bob");
    };
    const auto add_dave = [] {
        return test::AddUser("dave");
    };
    const auto add_staff = [] {
        return test::AddGroup("staff");
    };
    const auto rename = [] {
        return SetUsers({{"bob", "robert"}, {"guest", "guest"}}, "secret");
    };
    const auto remove = [] {
        return test::DeleteUsers({"bob", "carol"});
    };
    const auto rename_group = [] {
        return test::SetGroup("staff", "crew", -1, {"bob"});
    };
    const auto remove_group = [] {
        return test::DeleteGroups({"staff"});
    };
    const struct {
        const char *what;
        std::function<int()> change;
        std::function<int()> same_name;
        std::vector<const char *> blocked;
        const char *file = nullptr;  // where a folder should be
    } rows[] = {
        {"rename", rename, add_bob, {"/usr/tavo/etc/smb.conf.tmp"}},
        {"rename", rename, add_bob, {"/etc/group_tmp"}},
        {"rename", rename, add_bob, {"/etc/ftpchroot.tmp", "/usr/tavo/etc/afpd.conf.tmp"}},
        {"rename", rename, add_bob, {"/usr/tavo/etc/netbkp.users.tmp"}},
        {"rename", rename, add_bob, {"/etc/rsyncd.secrets.tmp"}, "/var/services/homes/robert"},
        {"delete", remove, add_bob, {"/usr/tavo/etc/smb.conf.tmp", "/etc/rsyncd.secrets.tmp"}},
        {"delete", remove, add_bob, {"/etc/group_tmp"}},
        {"delete", remove, add_bob, {}, "/volume1/@tmp"},
        {"add", add_dave, [] { return test::DeleteUser("dave"); }, {}, "/var/services/homes/dave"},
        {"add",
         add_dave,
         [] {
             return SetUsers({{"dave", "david"}}, "");
         },
         {},
         "/var/services/homes/dave"},
        {"rename a group", rename_group, add_staff, {"/usr/tavo/etc/share.conf.tmp"}},
        {"rename a group", rename_group, add_staff, {"/usr/tavo/etc/smb.conf.tmp"}},
        {"delete a group", remove_group, add_staff, {"/usr/tavo/etc/smb.conf.tmp"}},
    };
    for (const auto &row : rows) {
        PutBack(before);
        ASSERT_EQ(NextChange(), 0);
        story_.Head(std::string(row.what) + " without " + (row.file ? row.file : row.blocked.back()));
        for (const char *path : row.blocked)
            ASSERT_EQ(::mkdir(path, 0700), 0);
        if (row.file)
            test::WriteFile(row.file, "");
        TELL(row.change());
        TELL(row.same_name());
        TELL(NextChange());
        for (const char *path : row.blocked)
            ASSERT_EQ(::rmdir(path), 0);
        if (row.file)
            ::unlink(row.file);
        TELL(NextChange());
        TELL(row.same_name());
        ExpectNothingLeft();
    }
}

}  // namespace
