// The contents of the four account files after every change, to the byte.
#include "tavo_user.h"

#include "account/account_story.h"
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
using UserFiles = test::AccountStory;

TEST_F(UserFiles, EveryChangeInTurn)
{
    constexpr int kDayAndMore = 86411;
    const auto modify = [&](const char *name, const std::function<void(TAVOUSER &)> &change) {
        const test::User user = GetUser(name);
        ASSERT_TRUE(user) << name;
        TAVOUSER changed = *user;
        change(changed);
        story_.Tell(std::string("change ") + name, [&] { return test::SetUser(name, &changed); });
    };
    const test::UserTexts added[] = {
        {.name = "alice",
         .password = "wonderland",
         .description = "Alice: the first",
         .mail = "alice@example.org",
         .privilege = 5},
        {.name = "Bob", .uid = 2000, .gid = 7, .home = "/volume1/bob", .shell = "/bin/sh", .expire = 20000},
        {.name = "J\xC3\xBCrgen M", .password = "Stra\xC3\x9F", .cannot_change = true}};
    for (const test::UserTexts &texts : added) {
        TELL(test::AddUser(texts));
        now += kDayAndMore;
    }
    modify("alice", [](TAVOUSER &user) {
        user.szDesc = const_cast<char *>("100% Alice");
        user.nExpired = 30000;
        user.fCannotChgPasswd = 1;
        user.nPrivilege = 35;
    });
    modify("bob", [](TAVOUSER &user) { user.szMail = const_cast<char *>("bob@example.org"); });
    now += kDayAndMore;
    TELL(test::Rename("alice", "carol"));
    TELL(test::Rename("BOB", "bOB"));
    now += kDayAndMore;
    modify("carol", [](TAVOUSER &user) { user.szPasswd = const_cast<char *>("looking glass"); });
    modify("admin", [](TAVOUSER &user) { user.szPasswd = const_cast<char *>("first"); });
    const test::User bob = test::MakeUser({.name = "bob"});
    const TAVOUSER *records[] = {bob.get()};
    const char *hashes[] = {"$1$abcdefgh$0123456789abcdefghijkl"};
    const char *lm[] = {"00112233445566778899AABBCCDDEEFF"};
    const char *nt[] = {"FFEEDDCCBBAA99887766554433221100"};
    TELL(TAVOUserSetPasswd(records, hashes, lm, nt, 1));
    now += kDayAndMore;
    TELL(test::DeleteUser("CAROL"));
    TELL(test::DeleteUser("j\xC3\x9CRGEN m"));
    now += kDayAndMore;
    TELL(TAVOUserAgingSet("bob", 1, 90, 14));
    TELL(TAVOUserLockSet("BOB", 1));
    TELL(TAVOUserLockSet("admin", 1));
    TELL(TAVOUserAgingSet("admin", -1, 365, -1));
    now += kDayAndMore;
    modify("bob", [](TAVOUSER &user) { user.szDesc = const_cast<char *>("away"); });  // which does not unlock
    TELL(TAVOUserLockSet("admin", 0));
}

// The system's own readers take every line, and a login with the password succeeds.
TEST_F(UserFiles, TheSystemReadsThem)
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
