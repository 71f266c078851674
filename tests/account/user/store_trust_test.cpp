// A local user without rights cannot read secrets, write anything that the library trusts, or block other programs, but
// can look up public facts.
#include "tavo_bdb.h"
#include "tavo_group.h"
#include "tavo_quota.h"
#include "tavo_user.h"

#include "account/group/group_fixture.h"
#include "account/user/as_nobody.h"
#include "account/user/user_fixture.h"
#include "support/container_text.h"
#include "support/planted_name.h"
#include "support/rounds.h"
#include "support/test.h"

#include <atomic>

#include <dirent.h>
#include <sys/mman.h>

namespace {

const std::set<std::string> kSecret{TAVO_USER_DB_SHADOW, TAVO_USER_DB_SMB};
const std::set<std::string> kPublic{TAVO_USER_DB_NAME,  TAVO_USER_DB_MISC, TAVO_USER_DB_UID,
                                    TAVO_GROUP_DB_NAME, TAVO_GROUP_DB_ID,  TAVO_GROUP_DB_DESC};

struct stat Look(const std::string &path)
{
    struct stat st = {};
    ::lstat(path.c_str(), &st);
    return st;
}

void ExpectOurs()
{
    for (const std::string &store : kSecret) {
        EXPECT_EQ(Look(store).st_mode, mode_t{S_IFREG | 0600}) << store;
        EXPECT_NE(::access((store + ".bak").c_str(), F_OK), 0) << "hashes are kept once";
    }
    for (const std::string &store : kPublic) {
        EXPECT_EQ(Look(store).st_mode, mode_t{S_IFREG | 0644}) << store;
        const mode_t backup = Look(store + ".bak").st_mode;
        EXPECT_TRUE(backup == 0 || backup == (S_IFREG | 0600)) << store << std::oct << backup;
    }
    for (const auto &entry : std::filesystem::directory_iterator("/tmp")) {
        const std::string name = entry.path().filename();
        EXPECT_FALSE(name.starts_with(".db.user.tmp") || name.starts_with(".db.group.tmp")) << name << " is left";
    }
}

std::vector<std::string> AllStores()
{
    std::vector<std::string> stores(kSecret.begin(), kSecret.end());
    stores.insert(stores.end(), kPublic.begin(), kPublic.end());
    return stores;
}

void TouchBoth()
{
    ASSERT_TRUE(test::GetUser("root"));
    ASSERT_GE(TAVOGroupTotalNum(TAVO_GROUP_LOCAL), 0);
}

TEST(StoreTrust, OwnersAndModes)
{
    TouchBoth();
    for (const std::string &store : AllStores())
        ::unlink(store.c_str());
    ASSERT_EQ(test::AddUser({.name = "alice", .password = "x"}), 0);
    TouchBoth();
    ExpectOurs();
    test::WriteFile("/etc/passwd", test::FileText("/etc/passwd") + "ext:x:901:100::/:/bin/sh\n");
    test::WriteFile("/etc/group", test::FileText("/etc/group") + "ext:x:901:\n");
    TouchBoth();
    ExpectOurs();
    // By a program's own open as well; a store elsewhere is as it always was.
    for (const std::string &store : AllStores()) {
        TAVOBDB *handle = TAVOBDbOpen(store.c_str(), O_RDWR, 1);
        ASSERT_TRUE(handle) << store;
        EXPECT_EQ(TAVOBDbClose(handle), 0);
        ::unlink(store.c_str());
        handle = TAVOBDbOpen(store.c_str(), O_RDWR | O_CREAT, 1);
        ASSERT_TRUE(handle) << store;
        EXPECT_EQ(TAVOBDbClose(handle), 0);
    }
    ExpectOurs();
    TAVOBDB *other = TAVOBDbOpen("/tmp/other.db", O_RDWR | O_CREAT, 1);
    ASSERT_TRUE(other);
    TAVOBDbClose(other);
    EXPECT_EQ(Look("/tmp/other.db").st_mode, mode_t{S_IFREG | 0666});
    ::unlink("/tmp/other.db");
}

// Stores as the library once made them: everybody can write to them, also through a mapping of old.
TEST(StoreTrust, NeverOpensFilesThatOthersMayWrite)
{
    ASSERT_EQ(test::AddUser({.name = "alice", .password = "x"}), 0);
    const std::string hash = test::GetUser("alice")->szPasswd;
    const std::function<void(const char *)> faults[] = {
        [](const char *store) { ::chmod(store, 0666); },
        [](const char *store) { ::chmod(store, 0660); },
        [](const char *store) { ::chmod(store, 04644); },
        [](const char *store) { ASSERT_EQ(::link(store, "/tmp/second"), 0); },
        [](const char *store) {
            if (::chown(store, test::kNobody, 0) != 0)
                ::chmod(store, 0666);
        },
    };
    for (const auto &fault : faults) {
        for (const std::string &store : AllStores()) {
            ::unlink("/tmp/second");
            TouchBoth();
            fault(store.c_str());
            const int fd = ::open(store.c_str(), O_RDWR | O_CLOEXEC);
            const ino_t before = Look(store).st_ino;
            char *mapped = static_cast<char *>(::mmap(nullptr, 4096, PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0));
            ::close(fd);
            ASSERT_NE(mapped, MAP_FAILED);
            TouchBoth();
            EXPECT_NE(Look(store).st_ino, before) << store;
            std::memset(mapped, 'x', 4096);
            ::munmap(mapped, 4096);
            EXPECT_EQ(test::GetUser("alice")->szPasswd, hash);
        }
    }
    ::unlink("/tmp/second");
    for (const std::string &store : AllStores()) {
        ::chmod(store.c_str(), 0666);
        EXPECT_EQ(TAVOBDbOpen(store.c_str(), O_RDWR, 1), nullptr) << store;
        EXPECT_EQ(TLIBErrGet(), ERR_DB_OPEN);
    }
    TouchBoth();
    ExpectOurs();
}

// A tree that takes minutes to walk, at every name that the library uses there.
TEST(StoreTrust, PlantedTreesBlockNoCall)
{
    TouchBoth();
    std::vector<std::string> names = AllStores();
    for (const char *more : {"/tmp/.db.user.tmp", "/tmp/.db.user.seal", "/tmp/.db.group.tmp", "/tmp/.db.group.seal"})
        names.push_back(more);
    for (const std::string &store : AllStores())
        names.push_back(store + ".bak");
    const std::string tree = "/tmp/tree";
    ASSERT_EQ(::mkdir(tree.c_str(), 0777), 0);
    ASSERT_EQ(::chdir(tree.c_str()), 0);
    for (int depth = 0; depth < 3000; ++depth) {
        ASSERT_EQ(::mkdir("d", 0777), 0);
        ASSERT_EQ(::chdir("d"), 0);
    }
    ASSERT_EQ(::chdir("/"), 0);
    std::string at = tree;  // the same tree comes back at the next name
    for (const std::string &name : names) {
        std::filesystem::remove(name);
        ASSERT_EQ(::rename(at.c_str(), name.c_str()), 0) << name;
        test::WriteFile("/etc/passwd", test::FileText("/etc/passwd") + "\n");
        test::WriteFile("/etc/group", test::FileText("/etc/group") + "\n");
        TouchBoth();
        const struct stat built = Look(TAVO_USER_DB_NAME);
        const struct stat built_group = Look(TAVO_GROUP_DB_NAME);
        TouchBoth();
        EXPECT_EQ(Look(TAVO_USER_DB_NAME).st_ino, built.st_ino) << name << ": built again by every call";
        EXPECT_EQ(Look(TAVO_GROUP_DB_NAME).st_ino, built_group.st_ino) << name;
        at = name;
        for (const auto &entry : std::filesystem::directory_iterator("/tmp"))
            if (entry.path().string().starts_with(name + ".aside."))
                at = entry.path();
        ASSERT_TRUE(S_ISDIR(Look(at).st_mode)) << name;
    }
    test::RemovePlanted(at);  // deeper than a process has descriptors
    ExpectOurs();
}

// The attacker's results, in memory that outlives its process.
struct Loot {
    std::atomic<int> tries;
    std::atomic<int> secrets;  // files with a hash in them that it could read
    std::atomic<int> writable;
    std::atomic<bool> stop;
};

void LookInto(Loot &loot, const std::string &path)
{
    ++loot.tries;
    if (const int fd = ::open(path.c_str(), O_RDWR | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK); fd >= 0) {
        struct stat st = {};
        if (::fstat(fd, &st) != 0 || st.st_uid != test::kNobody)
            ++loot.writable;
        void *mapped =
            st.st_size >= 4096 ? ::mmap(nullptr, 4096, PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0) : MAP_FAILED;
        if (mapped != MAP_FAILED)
            std::memset(mapped, 0, 4096);
        ::close(fd);
    }
    if (const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK); fd >= 0) {
        std::string text(1 << 20, '\0');
        const ssize_t got = ::read(fd, text.data(), text.size());
        text.resize(got > 0 ? size_t(got) : 0);
        if (text.find("$1$") != text.npos || text.find("0CB6948805F797BF2A82807973B89537") != text.npos)
            ++loot.secrets;
        ::close(fd);
    }
}

// Everything of the library's below /tmp and beside its text files, and traps at its names.
void Attack(Loot &loot)
{
    const std::vector<std::string> stores = AllStores();
    for (unsigned round = 0; !loot.stop; ++round) {
        for (const char *folder : {"/tmp", "/etc", "/usr/tavo/etc"}) {
            DIR *dir = ::opendir(folder);
            for (const dirent *entry = nullptr; dir && (entry = ::readdir(dir));) {
                const std::string name = entry->d_name;
                const std::string path = std::string(folder) + '/' + name;
                if (name.starts_with(".db.") || name.find("shadow") != name.npos || name.find(".commit") != name.npos ||
                    name.find("smbpasswd") != name.npos) {
                    LookInto(loot, path);
                    LookInto(loot, path + "/" + ".db.user.shadow.1379");
                }
            }
            if (dir)
                ::closedir(dir);
        }
        const std::string &store = stores[round % stores.size()];
        const std::string traps[] = {store, store + ".bak", "/tmp/.db.user.seal", "/tmp/.db.user.tmp"};
        const std::string &trap = traps[round / stores.size() % std::size(traps)];
        switch (round % 4) {
        case 0:
            ::mkdir(trap.c_str(), 0777);
            ::mkdir((trap + "/in").c_str(), 0777);
            break;
        case 1:
            if (::symlink("/etc/shadow", trap.c_str()) != 0)
                continue;
            break;
        case 2:
            ::close(::open(trap.c_str(), O_CREAT | O_EXCL | O_WRONLY, 0666));
            break;
        default:
            ::mkfifo(trap.c_str(), 0666);
            break;
        }
    }
}

TEST(StoreTrust, AttackWhileAccountsChange)
{
    if (!test::CanBecomeNobody())
        GTEST_SKIP() << "only one user id is mapped here";
    ::chmod("/tmp", 01777);
    ASSERT_EQ(test::AddUser({.name = "victim", .password = "secret"}), 0);
    const std::string hash = test::GetUser("victim")->szPasswd;
    ASSERT_TRUE(hash.starts_with("$1$"));
    const std::string samba = test::LineOf("/usr/tavo/etc/private/smbpasswd", "victim");
    auto *loot =
        static_cast<Loot *>(::mmap(nullptr, sizeof(Loot), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    ASSERT_NE(loot, MAP_FAILED);
    const pid_t child = ::fork();
    if (child == 0) {
        if (test::BecomeNobody())
            Attack(*loot);
        ::_exit(0);
    }
    const int rounds = test::Rounds(1000);
    int failed = 0;
    for (int i = 0; i < rounds; ++i) {
        const std::string name = "u" + std::to_string(i);
        failed += test::AddUser({.name = name, .password = "secret"}) != 0;
        failed += test::Rename(name, name + "r") != 0;
        failed += test::DeleteUser(name + "r") != 0;
        if (i % 8 == 0)
            for (const std::string &store : AllStores())
                ::unlink(store.c_str());
    }
    loot->stop = true;
    int status = 0;
    ::waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
    EXPECT_GT(loot->tries, rounds);
    EXPECT_EQ(loot->secrets, 0);
    EXPECT_EQ(loot->writable, 0);
    EXPECT_EQ(failed, 0);
    ::munmap(loot, sizeof *loot);
    EXPECT_EQ(test::GetUser("victim")->szPasswd, hash);
    EXPECT_EQ(test::LineOf("/usr/tavo/etc/private/smbpasswd", "victim"), samba);
    for (const char *name : {"/tmp/.db.user.tmp", "/tmp/.db.user.seal"})
        std::filesystem::remove_all(name);
    for (const auto &entry : std::filesystem::directory_iterator("/tmp"))
        if (Look(entry.path()).st_uid == test::kNobody)
            std::filesystem::remove_all(entry.path());
    TouchBoth();
    ExpectOurs();
}

// Every look-up that takes no secret.
std::string PublicAnswers()
{
    std::string text;
    const auto say = [&](int result, const std::string &more = "") {
        text += std::to_string(result) + " " + more + "\n";
    };
    const auto list = [&](const std::function<int(TLIBSZLIST **)> &into) {
        test::List names = test::MakeList({});
        say(test::Moving(names, into), testing::PrintToString(test::Items(names.get())));
    };
    const auto show = [&](int result, TAVOGROUP *found) {
        const test::Group group(found);
        say(result == 0 ? 0 : TLIBErrGet(),
            result == 0 ? group->szName + std::to_string(group->nGid) + testing::PrintToString(test::Members(*group))
                        : "");
    };
    list([=](TLIBSZLIST **names) { return TAVOUserEnum(names, TAVO_USER_LOCAL | TAVO_USER_DOMAIN_USED); });
    for (const char *name : {"alice", "ALICE", "ÄÖ", "äö", "toor", "nobody", "none", "admin", "guest", "a:b"})
        say(TAVOUserPrivilegeGet(name));
    const char *const names[] = {"alice", "none", "Root", "äö", "", "bob", "toor", "a", "b", "c", "d", "lp", nullptr};
    char valid[256] = "";
    say(TAVOUserGetValidUserList(names, valid, sizeof valid), valid);
    list([](TLIBSZLIST **found) { return TAVOGroupEnum(found, TAVO_GROUP_LOCAL); });
    TAVOGROUP *group = nullptr;
    for (const char *name : {"staff", "STAFF", "users", "none", "root"}) {
        const int result = TAVOGroupGet(name, &group);
        show(result, std::exchange(group, nullptr));
        char description[64] = "";
        const int length = TAVOGroupDescGet(name, description, sizeof description);
        say(length, description);
        list([=](TLIBSZLIST **members) { return TAVOGroupListMember(name, members); });
    }
    for (const int gid : {0, 65536, 65537, 100, 4711}) {
        const int result = TAVOGroupGetByGID(gid, &group);
        show(result, std::exchange(group, nullptr));
    }
    return text;
}

TEST(StoreTrust, LookUpsWithoutRights)
{
    if (!test::CanBecomeNobody())
        GTEST_SKIP() << "only one user id is mapped here";
    ASSERT_EQ(test::AddUser({.name = "alice", .password = "x", .mail = "a@b", .privilege = 5}), 0);
    ASSERT_EQ(test::AddUser({.name = "äö", .password = "x", .privilege = 2}), 0);
    ASSERT_EQ(::chmod("/usr/tavo/etc/private", 0700), 0);
    test::WriteFile("/etc/passwd", test::FileText("/etc/passwd") +
                                       "toor:x:0:0::/root:/bin/sh\nRoot:x:0:0::/root:/bin/sh\nbroken\n"
                                       "Alice:x:4000:100::/:/bin/sh\nDOM\\x:x:5000:100::/:/bin/sh\n");
    std::string group_text = "staff:x:65537:alice,nobody,bob\nSTAFF:x:65600:\nusers:x:100:alice\n";
    test::WriteFile("/etc/group", "#$_@GID__INDEX@_$65540$\nroot:x:0:\n" + group_text);
    test::WriteFile("/etc/group_desc", "staff:old hands\nSTAFF:new\n");
    const std::string answers = PublicAnswers();
    EXPECT_NE(answers.find("alice"), answers.npos);
    EXPECT_EQ(test::AsNobody(PublicAnswers), answers);
    // They do not need the stores, so neither damaged stores nor held locks stop them.
    for (const std::string &store : AllStores())
        ::unlink(store.c_str());
    EXPECT_EQ(test::AsNobody(PublicAnswers), answers);

    EXPECT_EQ(test::AsNobody([] {
                  return std::to_string(TAVOBDbOpen(TAVO_USER_DB_NAME, O_RDWR | O_CREAT, 1) ? 0 : TLIBErrGet());
              }),
              std::to_string(ERR_ACCESS_DENIED));
    EXPECT_NE(::access(TAVO_USER_DB_NAME, F_OK), 0) << "only root makes stores";
    EXPECT_TRUE(test::GetUser("alice"));
    EXPECT_EQ(test::AsNobody([&] {
                  TAVOBDB *names = TAVOBDbOpen(TAVO_USER_DB_NAME, O_RDONLY, 1);
                  TAVOBDB *hashes = TAVOBDbOpen(TAVO_USER_DB_SHADOW, O_RDONLY, 1);
                  return std::string(names ? "names" : "") + (hashes ? " hashes" : "");
              }),
              "names");
}

}  // namespace
