// The stores under /tmp are a cache: damage to them, and edits of the text files by other programs, lose no account and
// change nothing outside.
#include "tavo_group.h"
#include "tavo_user.h"

#include "account/account_story.h"
#include "account/group/group_fixture.h"
#include "account/user/user_fixture.h"
#include "support/rounds.h"
#include "support/test.h"

#include <random>

#include <dlfcn.h>

using test::AddUser;
using test::AllFiles;
using test::GetUser;

namespace {

constexpr std::array<const char *, 8> kStores{TAVO_USER_DB_NAME, TAVO_USER_DB_MISC, TAVO_USER_DB_SHADOW,
                                              TAVO_USER_DB_SMB,  TAVO_USER_DB_UID,  TAVO_GROUP_DB_NAME,
                                              TAVO_GROUP_DB_ID,  TAVO_GROUP_DB_DESC};

// One call of one libc function that is to fail, as a full or broken disk makes it.
struct Fault {
    const char *function = nullptr;
    int countdown = 0;
    int reason = 0;
} fault;

// Another program's action at the library's next rename.
std::function<void()> meanwhile;

// And at the next wait for the disk, when the new files have been composed from what the old ones said.
std::function<void()> at_sync;

int syncs = 0;  // how often the library waited for the disk

bool Fails(const char *function)
{
    if (!fault.function || std::strcmp(fault.function, function) != 0 || --fault.countdown != 0)
        return false;
    errno = fault.reason;
    return true;
}

template <class Function>
Function *Next(const char *name)
{
    return reinterpret_cast<Function *>(::dlsym(RTLD_NEXT, name));
}

}  // namespace

extern "C" {

int fsync(int fd)
{
    ++syncs;
    if (const auto act = std::exchange(at_sync, nullptr))
        act();
    return Fails("fsync") ? -1 : Next<int(int)>("fsync")(fd);
}

int fdatasync(int fd)
{
    ++syncs;
    return Next<int(int)>("fdatasync")(fd);
}

ssize_t write(int fd, const void *bytes, size_t count)
{
    return Fails("write") ? -1 : Next<ssize_t(int, const void *, size_t)>("write")(fd, bytes, count);
}

int rename(const char *from, const char *to)
{
    if (const auto act = std::exchange(meanwhile, nullptr))
        act();
    return Fails("rename") ? -1 : Next<int(const char *, const char *)>("rename")(from, to);
}

char *mkdtemp(char *name)
{
    return Fails("mkdtemp") ? nullptr : Next<char *(char *)>("mkdtemp")(name);
}

int fchown(int fd, uid_t uid, gid_t gid)
{
    return Fails("fchown") ? -1 : Next<int(int, uid_t, gid_t)>("fchown")(fd, uid, gid);
}
}

namespace {

void ForgetStores()
{
    for (const char *store : kStores)
        std::filesystem::remove_all(store);
    std::filesystem::remove_all("/tmp/.db.user.seal");
}

std::string ExternalEdit(const char *path, const std::string &line)
{
    const std::string text = test::FileText(path) + line + "\n";
    test::WriteFile(path, text);
    return text;
}

// Changes a byte in place, and makes sure that the file's time stamp has moved on: the kernel's clock for these ticks
// only every few milliseconds.
void FlipBit(const char *path, size_t at, int bit)
{
    struct stat before;
    struct stat after;
    ASSERT_EQ(::stat(path, &before), 0);
    const int fd = ::open(path, O_RDWR | O_CLOEXEC);
    char byte = 0;
    const off_t place = off_t(at % size_t(before.st_size));
    ASSERT_EQ(::pread(fd, &byte, 1, place), 1);
    byte = char(byte ^ (1 << bit));
    do {
        ASSERT_EQ(::pwrite(fd, &byte, 1, place), 1);
        ::stat(path, &after);
    } while (std::memcmp(&before.st_ctim, &after.st_ctim, sizeof before.st_ctim) == 0);
    ::close(fd);
}

TEST(UserStore, DamageOfEveryKind)
{
    for (int i = 0; i < 40; ++i)
        ASSERT_EQ(AddUser({.name = "user" + std::to_string(i), .password = "x", .mail = "m"}), 0);
    const std::string groups = "#$_@GID__INDEX@_$65540$\nroot:x:0:\nstaff:x:65540:bob\n";
    test::WriteFile("/etc/group", groups);
    test::WriteFile("/etc/group_desc", "staff:old hands\nghost:nobody's\n");
    const auto files = AllFiles();
    const int listed = TAVOUserTotalNum(TAVO_USER_LOCAL);
    const std::string outside = "/var/outside";
    test::WriteFile(outside, "precious\n", 0600);
    std::mt19937 random(20240521);
    const auto pick = [&](unsigned limit) {
        return random() % limit;
    };
    const auto plant_link = [&](const char *path) {
        std::filesystem::remove_all(path);
        ASSERT_EQ(::symlink(outside.c_str(), path), 0);
    };
    const std::function<void(const char *)> damages[] = {
        [](const char *store) { ::unlink(store); },
        [&](const char *store) { ASSERT_EQ(::truncate(store, off_t(pick(9000))), 0); },
        [&](const char *store) { FlipBit(store, random(), int(pick(8))); },
        [&](const char *store) { test::WriteFile(store, std::string(pick(20000), char(random()))); },
        [](const char *store) {
            ::unlink(store);
            ASSERT_EQ(::mkfifo(store, 0666), 0);
        },
        plant_link,
        [](const char *store) {
            ::unlink(store);
            ASSERT_EQ(::mkdir(store, 0777), 0);
            test::WriteFile(std::string(store) + "/in", "x");
        },
        [&](const char *store) {
            std::filesystem::copy_file(kStores[pick(kStores.size())], std::string(store) + ".x");
            ::rename((std::string(store) + ".x").c_str(), store);
        },
        [&](const char *) { plant_link("/tmp/.db.user.seal"); },
        [](const char *) {
            std::filesystem::remove_all("/tmp/.db.user.tmp");
            ASSERT_EQ(::mkfifo("/tmp/.db.user.tmp", 0666), 0);
            ::unlink("/tmp/.db.user.seal");
        },
        [&](const char *) {
            plant_link("/tmp/.db.user.tmp");
            ::unlink("/tmp/.db.user.seal");
        },
    };
    testing::internal::CaptureStderr();
    for (int round = 0; round < test::Rounds(2000); ++round) {
        // Every kind with every store, with one look-up or change after the other.
        const size_t kind = size_t(round) % std::size(damages);
        const char *store = kStores[size_t(round) % kStores.size()];
        SCOPED_TRACE(std::to_string(kind) + " " + store);
        damages[kind](store);
        char text[16];
        switch (round / 11 % 3) {
        case 0:
            ASSERT_TRUE(GetUser("USER17")) << std::hex << TLIBErrGet();
            ASSERT_EQ(TAVOUserTotalNum(TAVO_USER_LOCAL), listed);
            break;
        case 1:
            ASSERT_EQ(test::SetGroup("staff", "staff", -1, {"bob"}), 0);
            ASSERT_EQ(AddUser({.name = "new"}), 0);
            ASSERT_EQ(test::DeleteUser("new"), 0);
            ASSERT_EQ(test::Lines(test::FileText("/etc/passwd")).size(), test::Lines(files[0]).size());
            break;
        default:
            ASSERT_STREQ(GetUser("user3")->szMail, "m");
        }
        ASSERT_EQ(TAVOGroupDescGet("staff", text, sizeof text), 10);
        ASSERT_STREQ(text, "old hands");
        struct stat st;
        ASSERT_TRUE(::lstat(store, &st) == 0 && S_ISREG(st.st_mode) && st.st_uid == 0);
    }
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
    EXPECT_EQ(AllFiles()[0], files[0]);
    EXPECT_EQ(AllFiles()[1], files[1]);
    EXPECT_EQ(AllFiles()[3], files[3]);
    EXPECT_EQ(test::GroupFile() + test::DescFile(), groups + "staff:old hands\n");
    EXPECT_EQ(test::ReadFile(outside), "precious\n");
}

// Another program's edits are noticed, even in the same second as our own write or with an old time stamp.
TEST(UserStore, EditsByOtherPrograms)
{
    ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
    ExternalEdit("/etc/passwd", "extra:x:1500:100::/home/extra:/bin/sh");
    ExternalEdit("/etc/shadow", "extra:*:19000:0:99999:7:::");
    ASSERT_TRUE(GetUser("extra"));
    EXPECT_STREQ(GetUser("extra")->szPasswd, "*");
    struct stat st;
    ASSERT_EQ(::stat("/etc/passwd", &st), 0);
    const std::string replaced = [] {
        std::string text = test::FileText("/etc/passwd");
        return text.replace(text.find("/home/extra"), 11, "/HOME/extra");
    }();
    test::WriteFile("/etc/passwd", replaced);
    const struct timespec times[2] = {st.st_atim, st.st_mtim};
    ASSERT_EQ(::utimensat(AT_FDCWD, "/etc/passwd", times, 0), 0);
    EXPECT_STREQ(GetUser("extra")->szHome, "/HOME/extra") << "same size, same modification time";
    EXPECT_EQ(AddUser({.name = "bob"}), 0);
    EXPECT_EQ(test::LineOf("/etc/passwd", "extra"), "extra:x:1500:100::/HOME/extra:/bin/sh");
}

// The stores are being built from files that change meanwhile: what was read is given, once, and not taken for what the
// files say now.
TEST(UserStore, EditsWhileTheStoresAreBuilt)
{
    ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
    for (const char *name : {"ext1", "ext2"}) {
        ForgetStores();
        meanwhile = [&] {
            ExternalEdit("/etc/passwd", std::string(name) + ":x:901:100::/:/bin/sh");
        };
        EXPECT_FALSE(GetUser(name));
        ASSERT_FALSE(meanwhile) << "nothing was built";
        EXPECT_TRUE(GetUser(name));
    }
    // A program with a store of its own open, whose change keeps the stores sealed.
    TAVOBDB *names = TAVOBDbOpen(TAVO_USER_DB_NAME, O_RDWR, 1);
    ASSERT_TRUE(names);
    EXPECT_EQ(TAVOBDbDomainExpireTimeSet(names), 0);
    ExternalEdit("/etc/passwd", "ext3:x:902:100::/:/bin/sh");
    EXPECT_EQ(TAVOBDbClose(names), 0);
    EXPECT_TRUE(GetUser("ext3"));
}

// Of root's with the mode that they are made with. Others may belong to another user.
TEST(UserStore, FoldersOfDeadBuildersAreRemoved)
{
    const struct {
        const char *path;
        mode_t mode;
        bool is_left;
    } rows[] = {{"/tmp/.db.user.tmp.dead", 0700, false},
                {"/tmp/.db.user.tmp.open", 0755, true},
                {"/tmp/.db.group.tmp.dead", 0700, true},
                {"/tmp/db.user.tmp.dead", 0700, true}};
    for (const auto &row : rows) {
        ASSERT_EQ(::mkdir(row.path, row.mode), 0);
        test::WriteFile(std::string(row.path) + "/store", "x");
    }
    ForgetStores();
    ASSERT_TRUE(GetUser("root"));
    for (const auto &row : rows) {
        EXPECT_EQ(std::filesystem::exists(row.path), row.is_left) << row.path;
        std::filesystem::remove_all(row.path);
    }
}

// Another program edits the files during a change of ours, without the system's lock: accounts that our change does not
// touch keep its edits.
TEST(UserStore, EditsWhileOthersAreChanged)
{
    ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
    ASSERT_EQ(AddUser({.name = "bob", .password = "x"}), 0);
    const auto edit = [](const char *path, const std::string &from, const std::string &to) {
        std::string text = test::FileText(path);
        const size_t at = text.find(from);
        ASSERT_NE(at, text.npos) << path;
        test::WriteFile(path, text.replace(at, from.size(), to));
    };
    for (const char *name : {"carol", "dave"}) {
        at_sync = [&] {
            edit("/etc/passwd", "/homes/alice:", "/elsewhere/alice:");
            edit("/etc/shadow", "alice:$1$", "alice:$1$new");
            ExternalEdit("/etc/passwd", std::string("ext_") + name + ":x:901:100::/:/bin/sh");
            ExternalEdit("/etc/shadow", std::string("ext_") + name + ":*:1:0:99999:7:::");
        };
        EXPECT_EQ(AddUser({.name = name}), 0);
        ASSERT_FALSE(at_sync);
        edit("/etc/passwd", "/elsewhere/alice:", "/homes/alice:");
        edit("/etc/shadow", "alice:$1$new", "alice:$1$");
    }
    for (const char *name : {"carol", "dave", "ext_carol", "ext_dave", "bob"}) {
        EXPECT_NE(test::LineOf("/etc/passwd", name), "") << name;
        EXPECT_NE(test::LineOf("/etc/shadow", name), "") << name;
        EXPECT_TRUE(GetUser(name)) << name;
    }
    // A program that never stops editing makes the change fail, and nothing has changed.
    const std::function<void()> forever = [&] {
        ExternalEdit("/etc/passwd", "x" + std::to_string(syncs) + ":x:902:100::/:/bin/sh");
        at_sync = forever;
    };
    at_sync = forever;
    EXPECT_EQ(AddUser({.name = "erin"}), ERR_RENAME_FAILED);
    at_sync = nullptr;
    EXPECT_EQ(test::LineOf("/etc/passwd", "erin"), "");
    EXPECT_EQ(AddUser({.name = "erin"}), 0);
}

// Samba's own programs change hashes in place, under a lock on the file. What they have reported as done stays. Some of
// them look whether the file was replaced while they waited for the lock, others do not.
TEST(UserStore, SambaChangesItsFileMeanwhile)
{
    const char *path = "/usr/tavo/etc/private/smbpasswd";
    ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
    ASSERT_EQ(AddUser({.name = "bob", .password = "x"}), 0);
    const auto hash_of = [&](int round) {
        char hash[33];
        std::snprintf(hash, sizeof hash, "%032X", 1000 + round);
        return std::string(hash);
    };
    const int rounds = test::Rounds(800);
    const pid_t samba = ::fork();
    if (samba == 0) {
        for (int round = 0; round < rounds; ++round) {
            for (;;) {
                const int fd = ::open(path, O_RDWR | O_CLOEXEC);
                struct flock lock = {};
                lock.l_type = F_WRLCK;
                struct stat held;
                struct stat named;
                if (fd < 0 || ::fcntl(fd, F_SETLKW, &lock) != 0)
                    ::_exit(1);
                const bool looks_again = round % 2 == 0;
                if (::fstat(fd, &held) != 0 || ::stat(path, &named) != 0 ||
                    (looks_again && held.st_ino != named.st_ino)) {
                    ::close(fd);
                    continue;  // it was replaced while we waited
                }
                std::string text(static_cast<size_t>(held.st_size), '\0');
                if (::pread(fd, text.data(), text.size(), 0) != held.st_size)
                    ::_exit(4);
                const size_t at = text.find("alice:");
                const size_t hash = text.find(':', text.find(':', text.find(':', at) + 1) + 1) + 1;
                const std::string old = text.substr(hash, 32);
                if (round > 0 && old != hash_of(round - 1))
                    ::_exit(2);  // what was done before is gone
                if (::pwrite(fd, hash_of(round).data(), 32, off_t(hash)) != 32)
                    ::_exit(3);
                ::close(fd);
                ::usleep(useconds_t(round % 7 * 1000));
                break;
            }
        }
        ::_exit(0);
    }
    int status = -1;
    int changes = 0;
    for (; ::waitpid(samba, &status, WNOHANG) == 0; ++changes) {
        const std::string name = "u" + std::to_string(changes);
        ASSERT_EQ(AddUser({.name = name}), 0);
        ASSERT_EQ(test::DeleteUser(name), 0);
    }
    EXPECT_EQ(status, 0) << "1: no lock, 2: a change of Samba's was lost";
    EXPECT_GT(changes, 0);
    ASSERT_EQ(AddUser({.name = "last"}), 0);
    EXPECT_NE(test::LineOf(path, "alice").find(hash_of(rounds - 1)), std::string::npos);
}

using Stores = test::AccountStory;

// Accounts that share a user id, differ in case only, or have ids beyond the index survive every rewrite.
TEST_F(Stores, OddAccountsSurvive)
{
    for (const char *line :
         {"toor:x:0:0::/root:/bin/sh", "Root:x:0:0::/root:/bin/sh", "big:x:4294967294:1::/:/bin/false",
          "large:x:2000000:1::/:/bin/false", "pc$:x:1800:1::/:/bin/false"})
        ExternalEdit("/etc/passwd", line);
    ExternalEdit("/etc/shadow", "Root:mine:1:0:99999:7:::");
    ASSERT_EQ(AddUser({.name = "alice"}), 0);
    ForgetStores();
    TELL(AddUser({.name = "bob", .uid = 1800}));
    TAVOUSER *user = nullptr;
    const auto show = [&](int uid) {
        TELL(TAVOUserGetByUID(uid, &user));
        story_.Show("name", user->szName);
    };
    show(2000000);
    TELL(test::DeleteUser("pc$"));
    show(1800);  // the one that is left
    TAVOUserFree(user);
}

// Nothing is there at all: a start from nothing. Later files appear beside.
TEST_F(Stores, EmptyStart)
{
    const auto show_modes = [&] {
        struct stat st = {};
        for (const char *path : test::kAccountFiles)
            story_.Show(path, ::stat(path, &st) == 0 ? int(st.st_mode & 07777) : -1);
        return st.st_gid;
    };
    for (const char *path : test::kAccountFiles)
        ::unlink(path);
    TELL(GetUser("admin") != nullptr);
    ASSERT_EQ(std::filesystem::remove_all("/usr/tavo/etc/private"), 1u);
    TELL(AddUser({.name = "first"}));
    show_modes();
    ASSERT_EQ(::chmod("/etc/shadow", 0640), 0);
    if (::chown("/etc/shadow", 0, 42) != 0)
        GTEST_SKIP() << "only one user id is mapped here";
    TELL(AddUser({.name = "second"}));
    show_modes();
    struct stat st;
    ASSERT_EQ(::stat("/etc/shadow", &st), 0);
    EXPECT_EQ(st.st_gid, 42u);
}

// A program with handles of its own: what it deletes it may write, but stores that lack an account are not written.
TEST_F(Stores, DumpNeverLosesAnAccount)
{
    for (const char *name : {"alice", "bob"})
        ASSERT_EQ(AddUser({.name = name}), 0);
    const auto with_stores = [&](const std::function<void(TAVOUSERDB &)> &work) {
        TAVOBDB *stores[5];
        for (size_t i = 0; i < 5; ++i)
            stores[i] = TAVOBDbOpen(kStores[i], O_RDWR, 1);
        TAVOUSERDB db{stores[0], stores[1], stores[2], stores[3], stores[4]};
        work(db);
        for (TAVOBDB *store : stores)
            EXPECT_EQ(TAVOBDbClose(store), 0);
    };
    with_stores([&](TAVOUSERDB &db) { TELL(TAVOBDbDelete(db.pName, "ALICE", 6)); });
    const test::User carol = test::MakeUser({.name = "carol", .uid = 1200, .gid = 100});
    const test::User domain = test::MakeUser({.name = "DOM\\dora"});
    with_stores([&](TAVOUSERDB &db) {
        TELL(TAVOUserDBDump(&db));
        TELL(TAVOBDbDelete(db.pName, "BOB", 4));
        TELL(TAVOBDbSet(db.pName, "ALICE", 6, "alice:x:1027:100::/:/bin/csh", 29));
        TELL(TAVOUserDBDump(&db));
        TELL(TAVOUserDBSet(&db, "ALICE", carol.get()));
        TELL(TAVOUserDBSet(&db, nullptr, carol.get()));
        TELL(TAVOUserDBSet(&db, nullptr, domain.get()));
        TELL(TAVOUserDBDump(&db));
        TELL(TAVOUserDBGetFreeUid(&db));
    });
    for (const char *name : {"carol", "alice"})
        TELL(GetUser(name) != nullptr);
}

// Each write, sync, change of owner, folder and rename fails once: the code, the old files, and the next change works. After
// the first of the four renames the next call finishes what was begun.
TEST_F(Stores, OnDisksThatFail)
{
    ASSERT_EQ(AddUser({.name = "alice", .password = "x"}), 0);
    const struct {
        const char *function;
        int reason;
    } rows[] = {{"write", ENOSPC}, {"write", EIO},      {"fsync", EIO},     {"fsync", EDQUOT},
                {"fchown", EPERM}, {"mkdtemp", ENOSPC}, {"mkdtemp", EROFS}, {"rename", EIO}};
    for (const auto &row : rows) {
        for (int call = 1, hit = true; hit; ++call) {
            if (std::strcmp(row.function, "mkdtemp") == 0)
                ForgetStores();
            fault = {row.function, call, row.reason};
            story_.Head(row.function + std::string(" ") + std::to_string(call) + ": " + ::strerrorname_np(row.reason));
            TELL(AddUser({.name = "bob", .password = "y"}));
            hit = fault.countdown <= 0;
            fault = {};
            TELL(GetUser("bob") != nullptr);
            for (const char *path : test::kAccountFiles)
                EXPECT_NE(::access((std::string(path) + ".tmp").c_str(), F_OK), 0) << path;
            test::DeleteUser("bob");
        }
    }
}

// Every other file of the appliance that knows these users by name.
void NameThemEverywhere(const std::vector<std::string> &names)
{
    std::string samba = "[share]\n\tvalid users = ";
    std::string lines;
    std::string secrets;
    for (const std::string &name : names) {
        samba += name + ", ";
        lines += name + "\n";
        secrets += name + ":secret\n";
    }
    test::WriteFile("/usr/tavo/etc/smb.conf", samba + "admin\n");
    test::WriteFile("/etc/ftpchroot", lines + "admin\n");
    test::WriteFile("/usr/tavo/etc/netbkp.users", lines + "admin\n");
    test::WriteFile("/etc/rsyncd.secrets", secrets + "root:secret\n", 0600);
}

// How often a batch waits for the disk does not depend on its size, but on how many files there are to change.
TEST(UserStore, SyncsOfABatch)
{
    std::vector<std::string> names;
    for (int i = 0; i < 300; ++i)
        names.push_back("user" + std::to_string(i));
    const auto set = [&](bool add, const std::string &suffix) {
        test::Changes changes;
        for (const std::string &name : names)
            changes.emplace_back(add ? "" : name, name + suffix);
        return test::SetUsers(changes, "$1$ab$cd");
    };
    const auto remove = [&](const std::string &suffix) {
        std::vector<std::string> doomed;
        for (const std::string &name : names)
            doomed.push_back(name + suffix);
        return test::DeleteUsers(doomed);
    };
    const auto join = [&] {
        return test::AddGroup("staff", -1, names);
    };
    const struct {
        const char *what;
        std::function<int()> change;
        int most;
    } rows[] = {
        {"add", [&] { return set(true, ""); }, 9},
        {"a group of all", join, 2},
        {"nothing new", [&] { return set(false, ""); }, 0},
        {"rename, also in the group", [&] { return set(false, "r"); }, 11},
        {"delete, also from the group", [&] { return remove("r"); }, 11},
        {"add again", [&] { return set(true, ""); }, 9},
        {"the group again", [&] { return test::DeleteGroups({"staff"}) + join(); }, 4},
        {"rename everywhere", [&] { return NameThemEverywhere(names), set(false, "r"); }, 19},
        {"delete everywhere", [&] { return remove("r"); }, 17},
    };
    for (const auto &[what, change, most] : rows) {
        ASSERT_TRUE(GetUser("root"));
        syncs = 0;
        EXPECT_EQ(change(), 0) << what;
        EXPECT_LE(syncs, most) << what;
        EXPECT_GE(syncs, most / 2) << what << ": who did not wait does not know";
    }
    EXPECT_EQ(test::FileText("/usr/tavo/etc/netbkp.users") + test::FileText("/etc/rsyncd.secrets"),
              "admin\nroot:secret\n");
    EXPECT_EQ(test::LineOf("/etc/ftpchroot", "user7"), "") << "renamed there";
}

}  // namespace
