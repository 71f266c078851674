// The contents of the four account files after every change, to the byte.
#include "tavo_user.h"

#include "account/user/user_fixture.h"
#include "support/test.h"

#include <dlfcn.h>
#include <pwd.h>
#include <shadow.h>

namespace {

time_t now = 1700000000;

}  // namespace

// Takes the place of the clock, for salts and change times.
extern "C" time_t time(time_t *out)
{
    if (out)
        *out = now;
    return now;
}

namespace {

using test::GetUser;
using test::MakeUser;
using test::SetUser;

// The four files must be those of the folder golden/STATE. With TAVO_KEEP_GOLDEN in the environment they are written.
void ExpectFiles(const std::string &state)
{
    for (const char *path : test::kAccountFiles) {
        const std::string golden =
            std::string(TEST_GOLDEN) + "/" + state + "/" + std::string(std::filesystem::path(path).filename());
        if (const char *kept = std::getenv("TAVO_KEEP_GOLDEN")) {
            const std::filesystem::path copy =
                std::filesystem::path(kept) / state / std::filesystem::path(path).filename();
            std::filesystem::create_directories(copy.parent_path());
            test::WriteFile(copy, test::FileText(path));
        }
        EXPECT_EQ(test::FileText(path), test::ReadFile(golden)) << state << ": " << path;
    }
}

TEST(UserFiles, EveryChangeInTurn)
{
    test::CapturedLog log;
    const auto modified = [](const char *name, const std::function<void(TAVOUSER &)> &change) {
        const test::User user = GetUser(name);
        ASSERT_TRUE(user) << name;
        TAVOUSER changed = *user;
        change(changed);
        EXPECT_EQ(SetUser(name, &changed), 0) << name;
    };

    EXPECT_EQ(test::AddUser({.name = "alice",
                             .password = "wonderland",
                             .description = "Alice: the first",
                             .mail = "alice@example.org",
                             .privilege = 5}),
              0);
    now += 86411;
    EXPECT_EQ(test::AddUser({.name = "Bob",
                             .password = "",
                             .uid = 2000,
                             .gid = 7,
                             .home = "/volume1/bob",
                             .shell = "/bin/sh",
                             .expire = 20000}),
              0);
    EXPECT_EQ(test::AddUser({.name = "J\xC3\xBCrgen M",
                             .password = "Stra\xC3\x9F"
                                         "e",
                             .cannot_change = true}),
              0);
    ExpectFiles("1-added");

    now += 86411;
    modified("alice", [](TAVOUSER &user) {
        user.szDesc = const_cast<char *>("100% Alice");
        user.nExpired = 30000;
        user.fCannotChgPasswd = 1;
        user.nPrivilege = 35;
    });
    modified("bob", [](TAVOUSER &user) { user.szMail = const_cast<char *>("bob@example.org"); });
    ExpectFiles("2-modified");

    now += 86411;
    EXPECT_EQ(test::Rename("alice", "carol"), 0);
    EXPECT_EQ(test::Rename("BOB", "bOB"), 0);
    ExpectFiles("3-renamed");

    now += 86411;
    modified("carol", [](TAVOUSER &user) { user.szPasswd = const_cast<char *>("looking glass"); });
    modified("admin", [](TAVOUSER &user) { user.szPasswd = const_cast<char *>("first"); });
    const test::User bob = MakeUser({.name = "bob"});
    const TAVOUSER *records[] = {bob.get()};
    const char *hashes[] = {"$1$abcdefgh$0123456789abcdefghijkl"};
    const char *lm[] = {"00112233445566778899AABBCCDDEEFF"};
    const char *nt[] = {"FFEEDDCCBBAA99887766554433221100"};
    EXPECT_EQ(TAVOUserSetPasswd(records, hashes, lm, nt, 1), 0);
    ExpectFiles("4-passwords");

    now += 86411;
    EXPECT_EQ(test::DeleteUser("CAROL"), 0);
    EXPECT_EQ(test::DeleteUser("j\xC3\x9CRGEN m"), 0);
    ExpectFiles("5-deleted");

    now += 86411;
    EXPECT_EQ(TAVOUserAgingSet("bob", 1, 90, 14), 0);
    EXPECT_EQ(TAVOUserLockSet("BOB", 1), 0);
    EXPECT_EQ(TAVOUserLockSet("admin", 1), 0);
    EXPECT_EQ(TAVOUserAgingSet("admin", -1, 365, -1), 0);
    ExpectFiles("6-locked");

    // A change of something else does not unlock.
    now += 86411;
    modified("bob", [](TAVOUSER &user) { user.szDesc = const_cast<char *>("away"); });
    EXPECT_EQ(TAVOUserLockSet("admin", 0), 0);
    ExpectFiles("7-unlocked");
}

// The system's own readers take every line, and a login with the password succeeds.
TEST(UserFiles, TheSystemReadsThem)
{
    ASSERT_EQ(test::AddUser({.name = "alice", .password = "wonder:land", .description = "a:b"}), 0);
    ASSERT_EQ(test::AddUser({.name = "J\xC3\xBCrgen M", .password = "", .expire = 20000, .cannot_change = true}), 0);
    size_t accounts = 0;
    ::setpwent();
    while (::getpwent())
        ++accounts;
    ::endpwent();
    EXPECT_EQ(accounts, test::Lines(test::FileText("/etc/passwd")).size());

    const struct passwd *passwd = ::getpwnam("alice");
    ASSERT_TRUE(passwd);
    EXPECT_EQ(passwd->pw_uid, 1027u);
    EXPECT_STREQ(passwd->pw_dir, "/var/services/homes/alice");
    // The library that the tested one is linked with.
    const auto crypt = reinterpret_cast<char *(*)(const char *, const char *)>(::dlsym(RTLD_DEFAULT, "crypt"));
    ASSERT_TRUE(crypt);
    const struct spwd *shadow = ::getspnam("alice");
    ASSERT_TRUE(shadow);
    EXPECT_STREQ(crypt("wonder:land", shadow->sp_pwdp), shadow->sp_pwdp);
    EXPECT_STRNE(crypt("Wonder:land", shadow->sp_pwdp), shadow->sp_pwdp);
    EXPECT_EQ(shadow->sp_max, 99999);
    EXPECT_EQ(shadow->sp_expire, -1);
    shadow = ::getspnam("J\xC3\xBCrgen M");
    ASSERT_TRUE(shadow);
    EXPECT_STREQ(crypt("", shadow->sp_pwdp), shadow->sp_pwdp);
    EXPECT_EQ(shadow->sp_min, 100000);
    EXPECT_EQ(shadow->sp_expire, 20000);
    EXPECT_EQ(shadow->sp_warn, 7);
}

}  // namespace
