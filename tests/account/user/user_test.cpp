// The user family: what is refused and what that leaves, names, ids, enumeration, expiry, hashes, follow-ups.
#include "tavo_group.h"
#include "tavo_lock.h"
#include "tavo_user.h"

#include "account/account_story.h"
#include "account/user/user_fixture.h"
#include "support/container_text.h"
#include "support/scenario.h"
#include "support/test.h"

#include <sys/mount.h>

using namespace std::string_literals;
using test::AddUser;
using test::AllFiles;
using test::Fault;
using test::FaultOf;
using test::GetUser;
using test::LineOf;
using test::MakeUser;

namespace {

using Users = test::AccountStory;

TEST(UserName, Rule)
{
    std::string sixty_four;
    for (int i = 0; i < 64; ++i)
        sixty_four += "\xE2\x82\xAC";
    for (const std::string &good : {"a"s, "A.b-c_d 9"s, sixty_four, std::string(64, 'a'), ".."s, "a\xC3\xA9"s, "1000"s})
        EXPECT_EQ(BlTLIBIsUserName(good.c_str()), 1) << good;
    for (const std::string &bad : {sixty_four + "a", std::string(65, 'a'), ""s, "-a"s, " a"s, "a "s, "a:b"s, "a\\b"s,
                                   "a\nb"s, "a,b"s, "a/b"s, "a\x7F"s, "a@b"s})
        EXPECT_EQ(BlTLIBIsUserName(bad.c_str()), 0) << bad;
    EXPECT_EQ(BlTLIBIsUserName(nullptr), 0);
}

TEST_F(Users, RecordsHoldEveryFieldAndAreRefilledFromThemselves)
{
    TAVOUSER *user = nullptr;
    const auto show = [&] {
        const std::vector<std::string> texts{user->szName, user->szPasswd, user->szDesc,
                                             user->szHome, user->szShell,  user->szMail};
        story_.Show("texts", texts);
        for (const int number :
             {user->nUid, user->nGid, user->nExpired, user->nPrivilege, int(user->fCannotChgPasswd), int(user->nKind)})
            story_.Show("number", number);
    };
    TELL(TAVOUserAlloc(&user, "n", "p", 1, 2, "d", "h", "s", 3, 4, "m", 5));
    show();
    TELL(TAVOUserAlloc(&user, user->szMail, user->szName, 10, 20, user->szShell, user->szDesc, user->szPasswd, 30, 0,
                       user->szHome, 50));
    show();
    TELL(TAVOUserAlloc(&user, "DOM\\u", nullptr, 0, 0, nullptr, nullptr, nullptr, 0, 7, nullptr, 0));
    TELL(TAVOUserAlloc(&user, "", "p", 1, 2, "d", "h", "s", 3, 4, "m", 5));
    show();  // a refused refill leaves the record
    TAVOUserFree(user);
    TAVOUserFree(nullptr);
}

TEST_F(Users, RefusalsLeaveTheFiles)
{
    ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
    const std::string huge(4096, 'x');
    using test::UserTexts;
    const struct {
        std::string UserTexts::*field;
        std::vector<std::string> bad;
    } rows[] = {
        {&UserTexts::name, {"ALICE", "a:b", "..", ".", "bad\xFF", "x\nroot::0:0::/:/bin/sh", huge}},
        {&UserTexts::description, {"a\nroot::0:0::/:/bin/sh", "a\rb", huge}},
        {&UserTexts::home, {"/a:b", "/a\nb", "/homes/../etc", "homes", "/" + huge}},
        {&UserTexts::shell, {"/" + huge, "/bin/../sh", "/bin/sh:x", "/bin/sh\n"}},
        {&UserTexts::mail, {huge, "a:b", "a\nb", "\x01"}},
        {&UserTexts::password, {huge}},
    };
    for (const auto &row : rows)
        for (const std::string &bad : row.bad) {
            UserTexts texts{.name = "eve"};
            texts.*row.field = bad;
            story_.Head(bad.substr(0, 40));
            TELL(AddUser(texts));
        }
    TELL(AddUser({.name = "eve", .uid = -2}));
    for (const auto &[old_name, name] :
         test::Changes{{"nobody here", "eve"}, {"alice", "Admin"}, {"root", "toor"}, {"ADMIN", "boss"}}) {
        story_.Head(old_name + " becomes " + name);
        TELL(test::SetUser(old_name, MakeUser({.name = name}).get()));
    }
    for (const char *name : {"Root", "aDMIN", "nobody here"})
        TELL(test::DeleteUser(name));
    TELL(TAVOUserSet(nullptr, nullptr, 0));
    TELL(TAVOUserSetOne("alice", nullptr));
}

// One bad entry among good ones: it is logged and skipped, the rest is applied in one rewrite.
TEST_F(Users, ABatchSkipsWhatFails)
{
    const test::User good = MakeUser({.name = "one"});
    const test::User bad = MakeUser({.name = "two:"});
    const test::User also = MakeUser({.name = "three"});
    const test::User renamed = MakeUser({.name = "four"});
    const TAVOUSER *users[] = {good.get(), bad.get(), also.get(), good.get(), renamed.get(), renamed.get()};
    const char *old_names[] = {nullptr, nullptr, nullptr, nullptr, "guest", "GUEST"};
    TELL(TAVOUserSet(old_names, users, 6));  // with the code of the last entry that failed
    TELL(test::SetUser("ghost", renamed.get()));
    EXPECT_TRUE(GetUser("one") && GetUser("three") && GetUser("four"));
    EXPECT_FALSE(GetUser("guest"));
}

TEST(UserSet, UidsOfTheRange)
{
    const auto current = [](int32_t uid) {
        TAVOBDB *store = TAVOBDbOpen(TAVO_USER_DB_UID, O_RDWR, 1);
        ASSERT_NE(store, nullptr);
        EXPECT_EQ(TAVOBDbSet(store, TAVO_BDB_KEY_UID, TAVO_BDB_KEY_UID_LEN, &uid, 4), 0);
        EXPECT_EQ(TAVOBDbClose(store), 0);
    };
    ASSERT_TRUE(GetUser("admin"));
    current(3070);
    EXPECT_EQ(AddUser({.name = "c"}), 0);
    EXPECT_EQ(GetUser("c")->nUid, 3071) << "a counter that a program stored is not lost";

    // All 2,049 ids: three are taken.
    test::Changes added;
    for (int i = 0; i < 2049 - 3; ++i)
        added.emplace_back("", "u" + std::to_string(i));
    ASSERT_EQ(test::SetUsers(added, ""), 0);
    EXPECT_EQ(AddUser({.name = "full"}), ERR_TOO_MANY_USERS);
    EXPECT_EQ(test::Lines(test::FileText("/etc/passwd")).size(), 2049u + 7);
    EXPECT_EQ(test::DeleteUser("u1000"), 0);
    EXPECT_EQ(AddUser({.name = "again"}), 0);
    EXPECT_EQ(AddUser({.name = "full"}), ERR_TOO_MANY_USERS);

    const auto before = AllFiles();
    ASSERT_EQ(::unlink("/tmp/.db.user.seal"), 0);
    EXPECT_EQ(AddUser({.name = "full"}), ERR_TOO_MANY_USERS) << "also in stores that were rebuilt";
    EXPECT_EQ(AllFiles(), before);
    EXPECT_EQ(AddUser({.name = "toor", .uid = 0}), 0);
    EXPECT_EQ(GetUser("toor")->nUid, 0) << "an id that the caller chose";
}

TEST_F(Users, ListsByFlagAndText)
{
    for (const char *name : {"Zoe", "anna", "Annika", "bob"})
        ASSERT_EQ(AddUser({.name = name}), 0);
    ASSERT_EQ(AddUser({.name = "service", .uid = 900}), 0);
    TLIBSZLIST *list = PslTLIBSzListAlloc(64);
    const auto show = [&] {
        story_.Show("names", test::Items(list));
        TLIBSzListRemoveAll(list);
    };
    for (const int flags : {1, 3, 2, 0xFF9, 0, 8}) {
        story_.Head("flags " + std::to_string(flags));
        TELL(TAVOUserEnum(&list, flags));
        show();
    }
    TELL(TAVOUserEnumByPrefix(&list, 1, "aNN"));
    show();
    TELL(TAVOUserEnumBySubstr(&list, 1, "O"));
    show();
    TELL(TAVOUserEnumBySubstr(&list, 1, ""));
    show();
    // Those in use come first.
    test::WriteFile("/usr/tavo/etc/duser_used", "DOM\\joe\nnot one\nDOM\\ann\n");
    TELL(TAVOUserEnum(&list, TAVO_USER_LOCAL | TAVO_USER_DOMAIN_USED));
    show();
    TELL(TAVOUserTotalNum(1));
    TLIBSzListFree(list);

    const char *const members[] = {"BOB", "ghost", "", "Zoe", nullptr};
    char text[8] = "";
    TELL(TAVOUserGetValidUserList(members, nullptr, 0));
    TELL(TAVOUserGetValidUserList(members, text, 7));
    TELL(TAVOUserGetValidUserList(members, text, 8));
    story_.Show("text", text);
    for (const char *name : {"ADMIN", "Guest", "DOM\\joe", "ghost"})
        TELL(TAVOUserPrivilegeGet(name));
    // A failure leaves the record.
    TAVOUSER *user = nullptr;
    for (const int uid : {900, 901}) {
        TELL(TAVOUserGetByUID(uid, &user));
        story_.Show("name", user->szName);
    }
    TAVOUserFree(user);
}

TEST_F(Users, LimitIsMaxAccountsLessAccounts)
{
    for (const char *line :
         {"maxaccounts=\"12\"\nsupportguest=no\n",  // admin alone: the guest does not count without support
          "maxaccounts=\"12\"\nsupportguest=yes\n", "maxaccounts=\nsupportguest=yes\n",
          "maxaccounts=\"1\"\nsupportguest=yes\n", "maxdisks=4\n", "maxaccounts=many\n"}) {
        test::WriteFile("/etc.defaults/tavoinfo.conf", line);
        story_.Head(line);
        TELL(TAVOConfGetUserLimit());
    }
    ASSERT_EQ(::unlink("/etc.defaults/tavoinfo.conf"), 0);
    TELL(TAVOConfGetUserLimit());
}

TEST_F(Users, ExpireOnDays)
{
    const test::User user = MakeUser({.name = "a", .expire = -7});
    char text[16] = "";
    for (const char *zone : {"UTC0", "EST5EDT,M3.2.0,M11.1.0", "LINT-14"}) {
        ::setenv("TZ", zone, 1);
        ::tzset();
        for (const char *date :
             {"2023/11/05", "1969/12/31", "1970/01/03", "1970/01/01", "2100/02/28", "2024/2/29",  // and what is none
              "", "yesterday", "2023-11-05", "2023/13/01", "2023/02/30", "2023/11/05x"}) {
            story_.Head(date + std::string(" in ") + zone);
            TELL(TAVOUserExpiredDateFill(user.get(), date));
            TELL(TAVOUserExpiredDateGet(user.get(), text, sizeof text));
            story_.Show("date", text);
            story_.Show("day", user->nExpired);
        }
    }
    user->nExpired = 5;
    TELL(TAVOUserExpiredDateGet(user.get(), text, 8));  // 1970/1/6 has eight characters
    ASSERT_EQ(AddUser({.name = "gone", .expire = 1000}), 0);
    ASSERT_EQ(AddUser({.name = "stays", .expire = -1}), 0);
    for (const char *name : {"GONE", "stays", "ghost"})
        TELL(TAVOUserCheckExpired(name));
}

// Hashes that other systems publish for these passwords.
TEST(SambaHashes, KnownPasswords)
{
    const struct {
        const char *password;
        const char *lm;
        const char *nt;
    } rows[] = {
        {"", "AAD3B435B51404EEAAD3B435B51404EE", "31D6CFE0D16AE931B73C59D7E0C089C0"},
        {"password", "E52CAC67419A9A224A3B108F3FA6CB6D", "8846F7EAEE8FB117AD06BDD830B7586C"},
        {"SecREt01", "FF3750BCC2B22412C2265B23734E0DAC", "CD06CA7C7E10C99B1D33B7485A2ED808"},
    };
    unsigned char hash[16];
    for (const auto &row : rows) {
        EXPECT_EQ(TLIBSmbLmHash(row.password, hash), 0);
        EXPECT_EQ(test::Hex(hash), row.lm) << row.password;
        EXPECT_EQ(TLIBSmbMd4Hash(row.password, hash), 0);
        EXPECT_EQ(test::Hex(hash), row.nt) << row.password;
    }
    std::string salts;
    for (int i = 0; i < 64; ++i)
        salts += TAVOUserRandomNumMap2Seed(-i - 64);
    EXPECT_EQ(salts, "0123456789ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz./");
}

TEST_F(Users, FoldersListsAndServicesFollow)
{
    test::WriteFile("/etc/tavoinfo.conf", "userHomeEnable=\"yes\"\nrunsamba=\"yes\"\n");
    test::WriteFile("/etc/ftpchroot", "carl\nAlice\n");
    test::WriteFile("/usr/tavo/etc/smb.conf", "[s]\nvalid users = alice, @alice, bob\n");
    test::WriteFile("/usr/tavo/etc/afpd.conf", "- -uamlist uams_noguest.so,uams_dhx.so\n", 0640);
    test::WriteFile("/usr/tavo/etc/netbkp.users", "alice\nadmin\n");
    test::WriteFile("/etc/rsyncd.secrets", "alice:old\nother:secret\n", 0600);
    test::WriteFile("/usr/tavo/etc/share.conf", "[homes]\npath=/volume1/homes\n");
    ASSERT_EQ(::mkdir("/volume1", 0755), 0);
    if (::chown("/volume1", 1030, 100) != 0)
        GTEST_SKIP() << "only one user id is mapped here";
    ASSERT_EQ(::mkdir("/volume1/homes", 0755), 0);
    ASSERT_EQ(::symlink("/volume1/homes", "/var/services/homes"), 0);

    TELL(AddUser({.name = "alice", .password = "pw"}));
    struct stat st;
    ASSERT_EQ(::stat("/volume1/homes/alice", &st), 0);
    EXPECT_EQ(st.st_uid, 1027u);
    EXPECT_EQ(st.st_gid, 100u);
    EXPECT_EQ(st.st_mode & 07777, 0755u);
    test::WriteFile("/volume1/homes/alice/letter", "mine\n");
    TELL(test::Rename("alice", "carol"));
    EXPECT_EQ(test::ReadFile("/volume1/homes/carol/letter"), "mine\n");
    EXPECT_NE(::access("/volume1/homes/alice", F_OK), 0);

    // What would be another line of credentials is not stored, and the old password is no longer good.
    const test::User carol = GetUser("carol");
    TAVOUSER changed = *carol;
    changed.szPasswd = const_cast<char *>("new\nother:known");
    TELL(test::SetUser("carol", &changed));

    // A renamed user never gets, or loses, the folder of another user.
    ASSERT_EQ(::mkdir("/volume1/homes/dave", 0700), 0);
    ASSERT_EQ(test::Rename("carol", "dave"), 0);
    EXPECT_EQ(test::ReadFile("/volume1/homes/carol/letter"), "mine\n");
    ASSERT_EQ(test::Rename("dave", "carol"), 0);

    for (const char *password : {"", "closed"})
        TELL(test::SetUser("guest", MakeUser({.name = "guest", .password = password}).get()));
    ASSERT_EQ(::unlink("/usr/tavo/etc/afpd.conf"), 0);
    EXPECT_EQ(test::SetUser("guest", MakeUser({.name = "guest"}).get()), ERR_FILE_NOT_FOUND) << "set, but applied";

    // Deleting follows no link that a user left in the home folder.
    test::WriteFile("/volume1/precious", "keep\n");
    ASSERT_EQ(::symlink("/volume1", "/volume1/homes/carol/link"), 0);
    TELL(test::DeleteUser("carol"));
    EXPECT_EQ(test::ReadFile("/volume1/precious"), "keep\n");
    TELL(AddUser({.name = "erin"}));
    TELL(test::DeleteUser("erin"));  // the folder of the stages is there already
}

// The share is a file system of its own, so a home cannot be renamed into the volume's stage.
TEST(UserFollowUp, AHomeOnAnotherFileSystemIsMovedByCommand)
{
    test::WriteFile("/usr/tavo/etc/share.conf", "[homes]\npath=/volume7/homes\n");
    std::filesystem::create_directories("/volume7/homes");
    if (::mount("tmpfs", "/volume7/homes", "tmpfs", 0, nullptr) != 0)
        GTEST_SKIP() << "cannot mount here";
    ASSERT_EQ(AddUser({.name = "alice"}), 0);
    std::filesystem::create_directories("/volume7/homes/alice");
    test::WriteFile("/volume7/homes/alice/letter", "mine\n");
    EXPECT_EQ(test::DeleteUser("alice"), 0);
    EXPECT_FALSE(std::filesystem::exists("/volume7/homes/alice"));
    EXPECT_TRUE(std::filesystem::is_empty("/volume7/@tmp"));
    ::umount2("/volume7/homes", MNT_DETACH);
}

// A folder that is not there is not worth a line; one that cannot be looked for is.
TEST_F(Users, HomesThatCannotBeLookedForAreLogged)
{
    test::WriteFile("/etc/tavoinfo.conf", "userHomeEnable=\"yes\"\n");
    test::WriteFile("/usr/tavo/etc/share.conf", "[homes]\npath=/volume8/homes\n");
    std::filesystem::create_directories("/volume8");
    std::filesystem::remove("/var/services/homes");
    ASSERT_EQ(::symlink("/volume8/homes", "/var/services/homes"), 0);
    for (const bool is_loop : {false, true}) {
        ASSERT_EQ(AddUser({.name = "alice"}), 0);
        if (is_loop) {
            ASSERT_EQ(::symlink("homes", "/volume8/homes"), 0);
        }
        TELL(test::Rename("alice", "carol"));
        TELL(test::DeleteUser("carol"));
    }
}

// A locked account opens with its old password or a new one only; what cannot be done changes nothing.
TEST_F(Users, LocksAndTheWayBack)
{
    ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
    ASSERT_EQ(AddUser({.name = "fixed", .password = "x", .cannot_change = true}), 0);
    ASSERT_EQ(AddUser({.name = "same ages", .password = "x"}), 0);
    std::string shadow = test::ReadFile("/etc/shadow");
    test::WriteFile("/etc/shadow", shadow.replace(shadow.find(":0:99999:", shadow.find("same ages:")), 9, ":30:30:"));
    const std::string open_shadow = LineOf("/etc/shadow", "alice");
    const std::string open_samba = LineOf("/usr/tavo/etc/private/smbpasswd", "alice");
    for (const char *name : {static_cast<const char *>(nullptr), "ghost", "DOM\\alice"})
        TELL(TAVOUserLockSet(name, 1));
    TELL(TAVOUserLockSet("admin", 0));  // '*' is not a hash
    TELL(TAVOUserAgingSet("ghost", 0, 1, 1));
    TELL(TAVOUserAgingSet("alice", 0, 100000, 1));
    TELL(TAVOUserAgingSet("alice", -2, 90, 1));
    TELL(TAVOUserAgingSet("alice", 90, 90, -1));      // would fix the password
    TELL(TAVOUserAgingSet("alice", 99999, -1, -1));   // beyond what is kept
    TELL(TAVOUserAgingSet("fixed", 1, -1, -1));       // would free it
    TELL(TAVOUserAgingSet("same ages", -1, 90, -1));  // the same ages, the last ones too
    TELL(TAVOUserAgingSet("fixed", -1, 90, -1));

    TELL(TAVOUserAgingSet("fixed", -1, -1, 14));
    EXPECT_EQ(GetUser("fixed")->fCannotChgPasswd, 1);
    TELL(TAVOUserLockSet("alice", 1));
    TELL(TAVOUserLockSet("Alice", 1));
    EXPECT_EQ(GetUser("alice")->szPasswd[0], '!');
    ASSERT_EQ(TAVOUserLockSet("alice", 0), 0);
    EXPECT_EQ(LineOf("/etc/shadow", "alice"), open_shadow);
    EXPECT_EQ(LineOf("/usr/tavo/etc/private/smbpasswd", "alice"), open_samba);

    ASSERT_EQ(TAVOUserLockSet("alice", 1), 0);
    TELL(test::SetUser("alice", MakeUser({.name = "alice", .password = "new"}).get()));
}

// A home of many files: once the stage is there and the locks are free, others go on while it is being removed.
TEST(UserFollowUp, LocksAreFreeWhileAHomeIsRemoved)
{
    constexpr int files = 4000;
    constexpr unsigned locks = TAVO_LOCK_USER | TAVO_LOCK_GROUP | TAVO_LOCK_SMB;
    test::WriteFile("/usr/tavo/etc/share.conf", "[homes]\npath=/volume1/homes\n");
    std::filesystem::create_directories("/volume1/homes");
    bool free_meanwhile = false;
    for (int round = 0; round < 10 && !free_meanwhile; ++round) {
        ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
        std::filesystem::create_directories("/volume1/homes/alice");
        for (int i = 0; i < files; ++i)
            test::WriteFile("/volume1/homes/alice/" + std::to_string(i), "");
        const pid_t pid = ::fork();
        if (pid == 0)
            ::_exit(test::DeleteUser("alice") == 0 ? 0 : 1);
        const std::string stage = "/volume1/@tmp/@del_users_home_" + std::to_string(pid);
        int status = 0;
        pid_t ended = 0;
        while ((ended = ::waitpid(pid, &status, WNOHANG)) == 0) {
            if (::access(stage.c_str(), F_OK) != 0 ||
                ErrTLIBFileLock(locks | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 0) != 0)
                continue;
            free_meanwhile |= ::access(stage.c_str(), F_OK) == 0;
            EXPECT_EQ(ErrTLIBFileUnlock(locks), 0);
        }
        EXPECT_EQ(ended, pid);
        EXPECT_EQ(status, 0);
        EXPECT_NE(::access("/volume1/homes/alice", F_OK), 0);
    }
    EXPECT_TRUE(free_meanwhile);
}

// A process of the test's is the daemon; where none runs, no tool is started.
TEST(UserFollowUp, CachesAreFlushedAndConnectionsEnded)
{
    const auto start = [](const char *pid_file) {
        std::filesystem::create_directories(std::filesystem::path(pid_file).parent_path());
        test::WriteFile(pid_file, std::to_string(::getpid()) + "\n");
    };
    {
        const test::Scenario none;
        ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
    }
    start("/var/run/nscd/nscd.pid");
    {
        test::Scenario scenario;
        scenario.Expect({"/usr/sbin/nscd", "-i", "passwd"}).Times(2);
        scenario.Expect({"/usr/sbin/nscd", "-i", "group"}).Times(2).Exits(1);
        scenario.InAnyOrder();
        EXPECT_EQ(TAVOUserLockSet("alice", 1), 0);
        EXPECT_EQ(TAVOUserLockSet("alice", 1), 0);  // changes nothing
        EXPECT_EQ(TAVOGroupDescSet("users", "all of us"), 0);
        EXPECT_EQ(test::DeleteUser("ghost"), ERR_NO_SUCH_USER);
    }
    std::filesystem::remove("/var/run/nscd/nscd.pid");
    start("/var/run/sssd.pid");
    test::Scenario scenario;
    scenario.Expect({"/usr/bin/smbstatus", "-b", "-u", "alice"})
        .Prints("PID     Username      Group         Machine\n"
                "1234    alice         users         desk (192.0.2.5)\n"
                "1235    alicea        users         desk (192.0.2.5)\n"
                "12x4    alice         users         desk (192.0.2.5)\n"
                "1236\n"
                "1237    alice         users         lap (192.0.2.6)\n");
    scenario.Expect({"/usr/bin/smbcontrol", "1234", "shutdown"}).Exits(1);
    scenario.Expect({"/usr/bin/smbcontrol", "1237", "shutdown"});
    scenario.Expect({"/usr/sbin/sss_cache", "-U", "-G"});
    EXPECT_EQ(test::DeleteUser("alice"), 0);
}

TEST_F(Users, StoreOnlyWhatIsAHash)
{
    ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
    const test::User alice = MakeUser({.name = "alice"});
    const test::User ghost = MakeUser({.name = "ghost"});
    const std::string hex(32, 'A');
    const auto set = [&](const TAVOUSER *user, const char *hash, const char *lm, const std::string &nt) {
        const char *nt_text = nt.c_str();
        return TAVOUserSetPasswd(&user, &hash, &lm, &nt_text, 1);
    };
    TELL(set(alice.get(), "a:b", hex.c_str(), hex));
    TELL(set(alice.get(), "a\nb", hex.c_str(), hex));
    TELL(set(alice.get(), "$1$a", "short", hex));
    TELL(set(alice.get(), "$1$a", hex.c_str(), hex + "A"));
    TELL(set(ghost.get(), "$1$a", hex.c_str(), hex));
    TELL(set(nullptr, "$1$a", hex.c_str(), hex));
    TELL(set(alice.get(), "$1$a", hex.c_str(), hex));
    EXPECT_STREQ(GetUser("alice")->szPasswd, "$1$a");
    const TAVOUSER *const none = nullptr;
    const char *const text = "";
    EXPECT_EQ(TAVOUserSetPasswd(&none, &text, &text, &text, 0), 0) << "nothing to do";

    // Programs that open the stores themselves read texts with their NUL, and the time of the file.
    const std::pair<const char *, const char *> stores[] = {{TAVO_USER_DB_NAME, "/etc/passwd"},
                                                            {TAVO_USER_DB_SHADOW, "/etc/shadow"},
                                                            {TAVO_USER_DB_MISC, "/etc/tavouser.conf"},
                                                            {TAVO_USER_DB_SMB, "/usr/tavo/etc/private/smbpasswd"}};
    for (const auto &[path, file] : stores) {
        TAVOBDB *const store = TAVOBDbOpen(path, O_RDONLY, 1);
        void *value = nullptr;
        int length = 0;
        ASSERT_EQ(TAVOBDbGet(store, "ALICE", 6, &value, &length), 0) << path;
        EXPECT_EQ(std::string(static_cast<char *>(value), static_cast<size_t>(length)), LineOf(file, "alice") + '\0');
        TAVOBDbFree(value);
        int32_t time = 0;
        struct stat st;
        ASSERT_EQ(::stat(file, &st), 0);
        EXPECT_EQ(TAVOBDbConfSyncTimeGet(store, &time), 0) << path;
        EXPECT_EQ(time, static_cast<int32_t>(st.st_mtime)) << path;
        EXPECT_EQ(TAVOBDbClose(store), 0);
    }
}

}  // namespace
