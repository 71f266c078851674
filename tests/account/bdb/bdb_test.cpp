// The stores of the account families: values, reserved keys, walks, and files that are none.
#include "tavo_bdb.h"

#include "support/test.h"

#include <ctime>

#include <sys/resource.h>

using namespace std::string_literals;
using test::Fault;
using test::FaultOf;
using test::LastFault;

namespace {

struct CloseStore {
    void operator()(TAVOBDB *store) const { EXPECT_EQ(TAVOBDbClose(store), 0); }
};
using Store = std::unique_ptr<TAVOBDB, CloseStore>;

Store Open(const std::string &path, int flags = O_RDWR | O_CREAT, int info = 1)
{
    return Store(TAVOBDbOpen(path.c_str(), flags, info));
}

int Set(const Store &store, const std::string &key, const std::string &value)
{
    return TAVOBDbSet(store.get(), key.data(), int(key.size()), value.data(), int(value.size()));
}

std::string Get(const Store &store, const std::string &key)
{
    void *value = nullptr;
    int length = -1;
    if (TAVOBDbGet(store.get(), key.data(), int(key.size()), &value, &length) != 0)
        return "(none)";
    const std::string copy(static_cast<char *>(value), size_t(length));
    EXPECT_EQ(static_cast<char *>(value)[length], 0) << "a text can be used as it is";
    TAVOBDbFree(value);
    return copy;
}

// All keys from the given first type on, walked with the second.
std::vector<std::string> Walk(const Store &store, int first, int next, int skip)
{
    std::vector<std::string> keys;
    void *key = nullptr;
    void *value = nullptr;
    int key_length = 0;
    int value_length = 0;
    TAVOBDbCursorSetType(store.get(), first);
    while (TAVOBDbCursorGet(store.get(), skip, &key, &key_length, &value, &value_length) == 0) {
        keys.emplace_back(static_cast<char *>(key), size_t(key_length));
        TAVOBDbFree(key);
        TAVOBDbFree(value);
        key = nullptr;
        TAVOBDbCursorSetType(store.get(), next);
    }
    EXPECT_EQ(LastFault(), (Fault{ERR_DB_END, "bdb_cursor_get"}));
    return keys;
}

TEST(Bdb, KeepsBytesAcrossOpens)
{
    const test::ScratchDir dir;
    for (const int info : {0, 1}) {
        const std::string path = dir / ("store" + std::to_string(info));
        {
            const Store store = Open(path, O_RDWR | O_CREAT, info);
            ASSERT_TRUE(store);
            EXPECT_EQ(store->nCursorType, TAVO_BDB_CURSOR_NEXT);
            EXPECT_EQ(Set(store, "KEY\0"s, "old"s), 0);
            EXPECT_EQ(Set(store, "KEY\0"s, "a\0b"s), 0);
            EXPECT_EQ(Set(store, "KEY"s, ""s), 0);
            EXPECT_EQ(Set(store, "G"s, "x"s), 0);
            EXPECT_EQ(TAVOBDbDelete(store.get(), "G", 1), 0);
        }
        const Store store = Open(path, O_RDONLY, 1 - info);
        ASSERT_TRUE(store);
        EXPECT_EQ(Get(store, "KEY\0"s), "a\0b"s) << "with its NUL it is another key than without";
        EXPECT_EQ(Get(store, "KEY"s), "");
        test::ForgetFault();
        EXPECT_EQ(Get(store, "G"s), "(none)");
        EXPECT_EQ(LastFault(), (Fault{ERR_KEY_NOT_FOUND, "bdb_get"}));
        testing::internal::CaptureStderr();
        EXPECT_EQ(FaultOf(TAVOBDbDelete(store.get(), "KEY", 3)), (Fault{ERR_DB_DELETE, "bdb_delete"}))
            << "opened for reading";
        EXPECT_EQ(FaultOf(Set(store, "KEY"s, "x"s)), (Fault{ERR_DB_STORE, "bdb_set"}));
        EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
    }
    EXPECT_EQ(dir.Names(), (std::vector<std::string>{"store0", "store1"})) << "nothing lies beside them";
}

TEST(Bdb, CursorTypes)
{
    const test::ScratchDir dir;
    const Store store = Open(dir / "store");
    for (const char *key : {"#B", "A", "C", "E"})
        ASSERT_EQ(Set(store, key, "v"), 0);
    using Keys = std::vector<std::string>;
    EXPECT_EQ(Walk(store, TAVO_BDB_CURSOR_FIRST, TAVO_BDB_CURSOR_NEXT, 0), (Keys{"#B", "A", "C", "E"}));
    EXPECT_EQ(Walk(store, TAVO_BDB_CURSOR_FIRST, TAVO_BDB_CURSOR_NEXT, 1), (Keys{"A", "C", "E"}));
    EXPECT_EQ(Walk(store, TAVO_BDB_CURSOR_LAST, TAVO_BDB_CURSOR_PREV, 1), (Keys{"E", "C", "A"}));

    const struct {
        const char *wanted;
        const char *found;
    } rows[] = {{"C", "C"}, {"B", "C"}, {"#", "#B"}, {"F", nullptr}};
    for (const auto &row : rows) {
        TAVOBDbCursorSetType(store.get(), TAVO_BDB_CURSOR_KEY);
        void *key = const_cast<char *>(row.wanted);
        void *value = nullptr;
        int key_length = int(std::strlen(row.wanted));
        int value_length = 0;
        const int result = TAVOBDbCursorGet(store.get(), 1, &key, &key_length, &value, &value_length);
        ASSERT_EQ(result, row.found ? 0 : -1) << row.wanted;
        if (!row.found)
            continue;
        EXPECT_EQ(std::string(static_cast<char *>(key), size_t(key_length)), row.found);
        TAVOBDbFree(key);
        TAVOBDbFree(value);
    }
    for (const int type : {0, 6, -1})
        EXPECT_EQ(FaultOf(TAVOBDbCursorSetType(store.get(), type)), (Fault{ERR_BAD_PARAMETERS, "bdb_cursor_set_type"}));
}

TEST(Bdb, ReservedKeysHaveTheirLengths)
{
    const test::ScratchDir dir;
    const Store store = Open(dir / "store");
    const auto number = [](int32_t value) {
        return std::string(reinterpret_cast<char *>(&value), 4);
    };
    EXPECT_EQ(TAVOBDbIsNeedToRebuild(store.get(), 1), -1);
    EXPECT_EQ(TAVOBDbConfSyncTimeSet(store.get(), 0x100000007), 0);
    EXPECT_EQ(TAVOBDbDeprecatedSet(store.get(), 0), 0);
    EXPECT_EQ(Set(store, "#CURRENT_UID"s, number(1)), 0);
    EXPECT_EQ(Set(store, "#CURRENT_UID"s, number(3072)), 0);
    EXPECT_EQ(Get(store, "#TAVO@SYNC@TIME"s), number(7)) << "fifteen bytes, no NUL";
    EXPECT_EQ(Get(store, "#TAVO@DEPRECATED\0"s), number(0)) << "seventeen bytes, its NUL among them";
    EXPECT_EQ(Get(store, "#CURRENT_UID"s), number(3072));
    EXPECT_EQ(Walk(store, TAVO_BDB_CURSOR_FIRST, TAVO_BDB_CURSOR_NEXT, 0).size(), 3u);
    EXPECT_TRUE(Walk(store, TAVO_BDB_CURSOR_FIRST, TAVO_BDB_CURSOR_NEXT, 1).empty())
        << "only reserved keys: at its end";

    EXPECT_EQ(TAVOBDbIsNeedToRebuild(store.get(), 7), 0);
    EXPECT_EQ(TAVOBDbIsNeedToRebuild(store.get(), 8), 1);
    int32_t value = -1;
    EXPECT_EQ(TAVOBDbConfSyncTimeGet(store.get(), &value), 0);
    EXPECT_EQ(value, 7);
    EXPECT_EQ(TAVOBDbDeprecatedGet(store.get(), &value), 0);
    EXPECT_EQ(value, 0);
}

TEST(Bdb, DomainPartGoesStale)
{
    const test::ScratchDir dir;
    const Store store = Open(dir / "store");
    EXPECT_EQ(TAVOBDbIsNeedToDomainRebuild(store.get()), 1) << "never refreshed";
    ASSERT_EQ(TAVOBDbDomainExpireTimeSet(store.get()), 0);
    int32_t set = 0;
    ASSERT_EQ(TAVOBDbDomainExpireTimeGet(store.get(), &set), 0);
    EXPECT_NEAR(double(set), double(std::time(nullptr)), 2);
    const struct {
        int32_t age;
        int stale;
    } rows[] = {{0, 0}, {295, 0}, {301, 1}, {-60, 1}};
    for (const auto &row : rows) {
        const int32_t then = int32_t(std::time(nullptr)) - row.age;
        Set(store, "#TAVO@EXPIRE@TIME"s, std::string(reinterpret_cast<const char *>(&then), 4));
        EXPECT_EQ(TAVOBDbIsNeedToDomainRebuild(store.get()), row.stale) << row.age;
    }
    EXPECT_EQ(TAVOBDbDomainExpireTimeDelete(store.get()), 0);
    EXPECT_EQ(FaultOf(TAVOBDbDomainExpireTimeDelete(store.get())),
              (Fault{ERR_KEY_NOT_FOUND, "bdb_domain_expire_time_delete"}));
}

// Files that are not stores are deleted, never followed, never waited for, and the database prints nothing.
TEST(Bdb, RemovesForeignFiles)
{
    const test::ScratchDir dir;
    const std::string path = dir / "store";
    const std::string outside = dir / "outside";
    std::string whole;
    {
        const Store store = Open(path);
        for (int i = 0; i < 2000; ++i)
            ASSERT_EQ(Set(store, std::to_string(i), std::string(50, 'v')), 0);
    }
    whole = test::ReadFile(path);
    ::unlink(path.c_str());
    test::WriteFile(outside, "mine\n", 0600);

    const auto put = [&](const std::string &text) {
        test::WriteFile(path, text);
    };
    const struct {
        std::function<void()> plant;
        const char *name;
    } rows[] = {
        {[&] { put("this is not a store\n"); }, "garbage"},
        {[&] { put(std::string(65536, '\0')); }, "zeros"},
        {[&] { put(whole.substr(0, 20000)); }, "cut"},
        {[&] { put(whole.substr(0, 100)); }, "only its head"},
        {[&] { put(whole.substr(0, 12) + "\x61\x15\x06" + whole.substr(15)); }, "other magic"},
        {[&] { put(whole.substr(0, 20) + "\x01\x10\0\0"s + whole.substr(24)); }, "odd page size"},
        {[&] { ASSERT_EQ(::symlink(outside.c_str(), path.c_str()), 0); }, "link"},
        {[&] { ASSERT_EQ(::mkfifo(path.c_str(), 0666), 0); }, "FIFO"},
    };
    test::CapturedLog log;
    for (const auto &row : rows) {
        row.plant();
        testing::internal::CaptureStderr();
        log.Clear();
        EXPECT_EQ(TAVOBDbOpen(path.c_str(), O_RDWR, 1), nullptr) << row.name;
        EXPECT_EQ(LastFault(), (Fault{ERR_DB_OPEN, "bdb_open"})) << row.name;
        EXPECT_EQ(log.Lines().size(), 1u) << row.name;
        EXPECT_NE(::access(path.c_str(), F_OK), 0) << row.name;
        const Store fresh = Open(path);
        ASSERT_TRUE(fresh) << row.name;
        EXPECT_EQ(Get(fresh, "0"), "(none)");
        EXPECT_EQ(testing::internal::GetCapturedStderr(), "") << row.name;
        ::unlink(path.c_str());
    }
    EXPECT_EQ(test::ReadFile(outside), "mine\n");

    const struct {
        const char *path;
        int flags;
        int code;
    } refused[] = {
        {nullptr, O_RDWR, ERR_BAD_PARAMETERS},
        {"", O_RDWR | O_CREAT, ERR_BAD_PARAMETERS},
        {path.c_str(), O_RDWR, ERR_FILE_NOT_FOUND},
        {dir.Path().c_str(), O_RDWR, ERR_DB_OPEN},
        {"/proc/none/x", O_RDWR | O_CREAT, ERR_FILE_NOT_FOUND},
    };
    for (const auto &row : refused) {
        EXPECT_EQ(TAVOBDbOpen(row.path, row.flags, 1), nullptr);
        EXPECT_EQ(LastFault(), (Fault{row.code, "bdb_open"})) << (row.path ? row.path : "NULL");
    }
    EXPECT_EQ(dir.Names(), (std::vector<std::string>{"outside"}));
}

// The database builds a new file as "__db.NAME" beside it; a killed process may have left one, or another user
// created it.
TEST(Bdb, LeftoversOfACreationDoNotMatter)
{
    const test::ScratchDir dir;
    ASSERT_EQ(::mkdir((dir / "__db.store").c_str(), 0700), 0);
    EXPECT_TRUE(Open(dir / "store"));
    struct stat st;
    ASSERT_EQ(::stat((dir / "store").c_str(), &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0666u);
}

// The database would say so on the standard error of whichever program called.
TEST(Bdb, AFailingWriteIsSaidByTheCodeOnly)
{
    const test::ScratchDir dir;
    struct rlimit before;
    ASSERT_EQ(::getrlimit(RLIMIT_FSIZE, &before), 0);
    const auto signalled = std::signal(SIGXFSZ, SIG_IGN);
    TAVOBDB *const store = TAVOBDbOpen((dir / "store").c_str(), O_RDWR | O_CREAT, 1);
    ASSERT_NE(store, nullptr);
    const struct rlimit small = {64 << 10, before.rlim_max};
    ::setrlimit(RLIMIT_FSIZE, &small);
    testing::internal::CaptureStderr();
    const std::string value(4000, 'x');
    bool failed = false;
    for (int key = 0; key < 40; ++key)  // less than the database keeps in memory, so that closing writes it
        failed |= TAVOBDbSet(store, &key, sizeof key, value.data(), int(value.size())) != 0;
    failed |= TAVOBDbClose(store) != 0;
    ::setrlimit(RLIMIT_FSIZE, &before);
    std::signal(SIGXFSZ, signalled);
    EXPECT_TRUE(failed);
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
}

TEST(Bdb, ANumberHasFourBytes)
{
    const test::ScratchDir dir;
    const Store store = Open(dir / "store");
    int32_t number = 0;
    EXPECT_EQ(Set(store, "#TAVO@SYNC@TIME", "five."), 0);
    EXPECT_EQ(FaultOf(TAVOBDbConfSyncTimeGet(store.get(), &number)), (Fault{ERR_DB_CURSOR, "bdb_conf_sync_time_get"}));
    TAVOBDbFree(nullptr);
}

}  // namespace
