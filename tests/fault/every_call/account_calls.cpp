// Users, groups, quotas and their stores: alice and bob, who are in the group staff.
#include "call.h"
#include "support/captured_log.h"
#include "support/container_text.h"

#include <gtest/gtest.h>

#include <ctime>
#include <filesystem>

#include <fcntl.h>

namespace every_call {
namespace {

using test::MakeList;

constexpr const char *kStore = "/tmp/every_call/store.db";
constexpr const char *kDevice = "/dev/vg1/volume_1";

struct OneUser {
    explicit OneUser(const char *name, int uid = -1)
    {
        TAVOUserAlloc(&user, name, "secret", uid, uid < 0 ? -1 : 100, "described", "", "", -1, 0, "", 0);
    }
    ~OneUser() { TAVOUserFree(user); }
    OneUser(const OneUser &) = delete;
    OneUser &operator=(const OneUser &) = delete;
    TAVOUSER *user = nullptr;
};

struct OneGroup {
    explicit OneGroup(const char *name, int gid = -1)
    {
        const char *const members[] = {"alice", "bob", nullptr};
        TAVOGroupAlloc2(&group, name, gid, members);
    }
    ~OneGroup() { TAVOGroupFree(group); }
    OneGroup(const OneGroup &) = delete;
    OneGroup &operator=(const OneGroup &) = delete;
    TAVOGROUP *group = nullptr;
};

struct Accounts {
    Accounts()
    {
        const test::CapturedLog quiet;
        std::filesystem::create_directories("/tmp/every_call");
        for (const char *name : {"alice", "bob"}) {
            const OneUser one(name);
            EXPECT_EQ(TAVOUserSetOne(nullptr, one.user), 0);
        }
        const OneGroup staff("staff");
        EXPECT_EQ(TAVOGroupSet(nullptr, staff.group), 0);
        EXPECT_EQ(TAVOGroupDescSet("staff", "old hands"), 0);
        TAVOBDB *store = TAVOBDbOpen(kStore, O_RDWR | O_CREAT, 1);
        EXPECT_EQ(TAVOBDbSet(store, "key", 3, "value", 5), 0);
        EXPECT_EQ(TAVOBDbConfSyncTimeSet(store, 1000), 0);
        EXPECT_EQ(TAVOBDbDeprecatedSet(store, 0), 0);
        EXPECT_EQ(TAVOBDbDomainExpireTimeSet(store), 0);
        TAVOBDbClose(store);
    }
};

// The store of a row, open.
struct Store {
    TAVOBDB *db = TAVOBDbOpen(kStore, O_RDWR, 1);

    ~Store()
    {
        if (db)
            TAVOBDbClose(db);
    }
};

struct UserStores {
    TAVOUSERDB all = {TAVOBDbOpen(TAVO_USER_DB_NAME, O_RDWR, 1), TAVOBDbOpen(TAVO_USER_DB_MISC, O_RDWR, 1),
                      TAVOBDbOpen(TAVO_USER_DB_SHADOW, O_RDWR, 1), TAVOBDbOpen(TAVO_USER_DB_SMB, O_RDWR, 1),
                      TAVOBDbOpen(TAVO_USER_DB_UID, O_RDWR, 1)};

    ~UserStores()
    {
        for (TAVOBDB *db : {all.pName, all.pMisc, all.pShadow, all.pSmb, all.pUid})
            if (db)
                TAVOBDbClose(db);
    }
};

struct GroupStores {
    TAVOGROUPDB all = {TAVOBDbOpen(TAVO_GROUP_DB_NAME, O_RDWR, 1), TAVOBDbOpen(TAVO_GROUP_DB_ID, O_RDWR, 1),
                       TAVOBDbOpen(TAVO_GROUP_DB_DESC, O_RDWR, 1)};

    ~GroupStores()
    {
        for (TAVOBDB *db : {all.pName, all.pGid, all.pDesc})
            if (db)
                TAVOBDbClose(db);
    }
};

struct Names {
    TLIBSZHASH *hash = PshTLIBSzHashAlloc(64);

    Names() { TLIBSzHashSetValue(&hash, "alice", "alicia"); }
    ~Names() { TLIBSzHashFree(hash); }
};

struct Found {
    TLIBSZLIST *list = MakeList({}).release();

    ~Found() { TLIBSzListFree(list); }
};

template <class Function, class... Args>
void OnStore(Trial &run, Function &function, Args... args)
{
    const Store store;
    run(function, store.db, args...);
}

template <class Function, class... Args>
void IntoList(Trial &run, Function &function, Args... args)
{
    Found found;
    run(function, &found.list, args...);
    run.Show(found.list);
}

}  // namespace

Family AccountFamily()
{
    return {
        "Accounts",
        {
            // Stores.
            CALL(TAVOBDbClose, 0,
                 {
                     Store store;
                     run(f, store.db);
                     store.db = nullptr;
                 }),
            CALL(TAVOBDbConfSyncTimeGet, 0,
                 {
                     const Store store;
                     int32_t time = 0;
                     run(f, store.db, &time);
                     run.Show(time);
                 }),
            CALL(TAVOBDbConfSyncTimeSet, 0, { OnStore(run, f, int64_t{2000}); }),
            CALL(TAVOBDbCursorGet, 0,
                 {
                     const Store store;
                     void *key = nullptr;
                     void *value = nullptr;
                     int key_length = 0;
                     int value_length = 0;
                     run(f, store.db, 1, &key, &key_length, &value, &value_length);
                     run.Show(key_length);
                     TAVOBDbFree(key);
                     TAVOBDbFree(value);
                 }),
            CALL(TAVOBDbCursorSetType, 0, { OnStore(run, f, int{TAVO_BDB_CURSOR_NEXT}); }),
            CALL(TAVOBDbDelete, 0, { OnStore(run, f, "key", 3); }),
            CALL(TAVOBDbDeprecatedGet, 0,
                 {
                     const Store store;
                     int32_t value = 7;
                     run(f, store.db, &value);
                     run.Show(value);
                 }),
            CALL(TAVOBDbDeprecatedSet, 0, { OnStore(run, f, 1); }),
            CALL(TAVOBDbDomainExpireTimeDelete, 0, { OnStore(run, f); }),
            CALL(TAVOBDbDomainExpireTimeGet, 0,
                 {
                     const Store store;
                     int32_t time = 0;
                     run(f, store.db, &time);
                 }),
            CALL(TAVOBDbDomainExpireTimeSet, 0, { OnStore(run, f); }),
            CALL(TAVOBDbFree, 0,
                 {
                     const Store store;
                     void *value = nullptr;
                     int length = 0;
                     TAVOBDbGet(store.db, "key", 3, &value, &length);
                     run(f, value);
                 }),
            CALL(TAVOBDbGet, 0,
                 {
                     const Store store;
                     void *value = nullptr;
                     int length = 0;
                     run(f, store.db, "key", 3, &value, &length);
                     run.Show(length);
                     TAVOBDbFree(value);
                 }),
            CALL(TAVOBDbIsNeedToDomainRebuild, kAnswers, { OnStore(run, f); }),
            CALL(TAVOBDbIsNeedToRebuild, kAnswers, { OnStore(run, f, int64_t{1000}); }),
            CALL(TAVOBDbOpen, 0,
                 {
                     TAVOBDB *store = run(f, kStore, O_RDWR, 1);
                     if (store)
                         TAVOBDbClose(store);
                 }),
            CALL(TAVOBDbSet, 0, { OnStore(run, f, "another", 7, "value", 5); }),

            // Users.
            CALL(BlTLIBIsUserName, kZeroFails | kNoCode, { run(f, "alice"); }),
            CALL(TAVOConfGetUserLimit, 0, { run(f); }),
            CALL(TAVOUserAgingSet, 0, { run(f, "alice", 1, 90, 14); }),
            CALL(TAVOUserAlloc, 0,
                 {
                     TAVOUSER *user = nullptr;
                     run(f, &user, "carol", "x", -1, -1, "", "", "", -1, 0, "", 0);
                     TAVOUserFree(user);
                 }),
            CALL(TAVOUserCheckExpired, 0, { run(f, "alice"); }),
            CALL(TAVOUserDBDump, 0,
                 {
                     UserStores stores;
                     run(f, &stores.all);
                 }),
            CALL(TAVOUserDBGetFreeUid, 0,
                 {
                     UserStores stores;
                     run(f, &stores.all);
                 }),
            CALL(TAVOUserDBSet, 0,
                 {
                     UserStores stores;
                     const OneUser one("carol", 2000);
                     run(f, &stores.all, static_cast<const char *>(nullptr), one.user);
                 }),
            CALL(TAVOUserDelete, kLeavesCode,
                 {
                     const char *const names[] = {"bob"};
                     run(f, names, 1);
                 }),
            CALL(TAVOUserEnum, 0, { IntoList(run, f, 1); }),
            CALL(TAVOUserEnumByPrefix, 0, { IntoList(run, f, 1, "al"); }),
            CALL(TAVOUserEnumBySubstr, 0, { IntoList(run, f, 1, "lic"); }),
            CALL(TAVOUserExpiredDateFill, 0,
                 {
                     OneUser one("alice");
                     run(f, one.user, "2037/1/31");
                     run.Show(one.user->nExpired);
                 }),
            CALL(TAVOUserExpiredDateGet, 0,
                 {
                     const OneUser one("alice");
                     char date[32] = "";
                     run(f, one.user, date, 32);
                     run.Show(date);
                 }),
            CALL(TAVOUserFree, 0,
                 {
                     TAVOUSER *user = nullptr;
                     TAVOUserAlloc(&user, "carol", "x", -1, -1, "", "", "", -1, 0, "", 0);
                     run(f, user);
                 }),
            CALL(TAVOUserGet, 0,
                 {
                     TAVOUSER *user = nullptr;
                     run(f, "alice", &user);
                     TAVOUserFree(user);
                 }),
            CALL(TAVOUserGetByUID, 0,
                 {
                     TAVOUSER *user = nullptr;
                     run(f, 0, &user);
                     TAVOUserFree(user);
                 }),
            CALL(TAVOUserGetValidUserList, 0,
                 {
                     const char *const names[] = {"alice", "nobody there", nullptr};
                     char text[64] = "";
                     run(f, names, text, 64);
                 }),
            CALL(TAVOUserIsExpired, 0, { run(f, 1); }),
            CALL(TAVOUserLockSet, 0, { run(f, "alice", 1); }),
            CALL(TAVOUserPrivilegeGet, 0, { run(f, "alice"); }),
            CALL(TAVOUserRandomNumMap2Seed, 0, { run(f, 1); }),
            CALL(TAVOUserRemoveTmpFiles, kAnswers, { run(f); }),
            CALL(TAVOUserSet, kLeavesCode,
                 {
                     const OneUser one("carol");
                     const char *const old_names[] = {nullptr};
                     const TAVOUSER *const users[] = {one.user};
                     run(f, old_names, users, 1);
                 }),
            CALL(TAVOUserSetOne, kLeavesCode,
                 {
                     const OneUser one("robert");
                     run(f, "bob", one.user);
                 }),
            CALL(TAVOUserSetPasswd, kLeavesCode,
                 {
                     const OneUser one("alice");
                     const TAVOUSER *const users[] = {one.user};
                     const char *const hashes[] = {"$1$abcdefgh$NGjcfXeLg.0fo4FzMqUTu1"};
                     const char *const lm[] = {"00000000000000000000000000000000"};
                     const char *const nt[] = {"00000000000000000000000000000000"};
                     run(f, users, hashes, lm, nt, 1);
                 }),
            CALL(TAVOUserTotalNum, 0, { run(f, 1); }),
            CALL(TLIBSmbLmHash, 0,
                 {
                     unsigned char hash[16] = {};
                     run(f, "secret", hash);
                     run.Show(hash[0]);
                 }),
            CALL(TLIBSmbMd4Hash, 0,
                 {
                     unsigned char hash[16] = {};
                     run(f, "secret", hash);
                     run.Show(hash[0]);
                 }),

            // Groups.
            CALL(BlTLIBIsGroupName, kZeroFails | kNoCode, { run(f, "staff"); }),
            CALL(TAVOGroupAlloc, 0,
                 {
                     TAVOGROUP *group = nullptr;
                     run(f, &group, "staff:x:65540:alice,bob");
                     TAVOGroupFree(group);
                 }),
            CALL(TAVOGroupAlloc2, 0,
                 {
                     TAVOGROUP *group = nullptr;
                     const char *const members[] = {"alice", nullptr};
                     run(f, &group, "crew", 65541, members);
                     TAVOGroupFree(group);
                 }),
            CALL(TAVOGroupDBGetFreeGid, 0,
                 {
                     GroupStores stores;
                     run(f, &stores.all);
                 }),
            CALL(TAVOGroupDBSet, 0,
                 {
                     GroupStores stores;
                     const OneGroup one("crew", 70000);
                     run(f, &stores.all, static_cast<const char *>(nullptr), one.group);
                 }),
            CALL(TAVOGroupDelete, kLeavesCode,
                 {
                     const char *const names[] = {"staff"};
                     run(f, names, 1);
                 }),
            CALL(TAVOGroupDescGet, 0,
                 {
                     char text[64] = "";
                     run(f, "staff", text, 64);
                     run.Show(text);
                 }),
            CALL(TAVOGroupDescSet, 0, { run(f, "staff", "new hands"); }),
            CALL(TAVOGroupEnum, 0, { IntoList(run, f, 1); }),
            CALL(TAVOGroupEnumByPrefix, 0, { IntoList(run, f, 1, "st"); }),
            CALL(TAVOGroupEnumBySubstr, 0, { IntoList(run, f, 1, "taf"); }),
            CALL(TAVOGroupFree, 0,
                 {
                     TAVOGROUP *group = nullptr;
                     TAVOGroupAlloc(&group, "staff:x:65540:alice,bob");
                     run(f, group);
                 }),
            CALL(TAVOGroupGet, 0,
                 {
                     TAVOGROUP *group = nullptr;
                     run(f, "staff", &group);
                     TAVOGroupFree(group);
                 }),
            CALL(TAVOGroupGetByGID, 0,
                 {
                     TAVOGROUP *group = nullptr;
                     run(f, 0, &group);
                     TAVOGroupFree(group);
                 }),
            CALL(TAVOGroupListMember, 0,
                 {
                     Found found;
                     run(f, "staff", &found.list);
                     run.Show(found.list);
                 }),
            CALL(TAVOGroupSet, 0,
                 {
                     const OneGroup one("crew");
                     run(f, "staff", one.group);
                 }),
            CALL(TAVOGroupTotalNum, 0, { run(f, 1); }),
            CALL(TAVOUserModifyGroup, 0,
                 {
                     const Names names;
                     run(f, names.hash);
                 }),

            // Quotas.
            CALL(TAVOQuotaClean, kAnswers,
                 {
                     TLIBSZLIST *users = MakeList({"alice"}).release();
                     run(f, users, kDevice);
                     TLIBSzListFree(users);
                 }),
            CALL(TAVOQuotaCleanAllVols, kAnswers,
                 {
                     TLIBSZLIST *users = MakeList({"alice"}).release();
                     run(f, users);
                     TLIBSzListFree(users);
                 }),
            CALL(TAVOQuotaFmtGet, kAnswers, { run(f, kDevice); }),
            CALL(TAVOQuotaGet, 0,
                 {
                     TAVOQUOTA quota = {};
                     run(f, "alice", kDevice, &quota);
                 }),
            CALL(TAVOQuotaInit, kAnswers, { run(f, 1); }),
            CALL(TAVOQuotaOff, kAnswers, { run(f, 1); }),
            CALL(TAVOQuotaSet, 0,
                 {
                     const float limit = 10;
                     run(f, "alice", kDevice, &limit);
                 }),
            CALL(TAVOSupportQUOTA, kAnswers, { run(f); }),
            CALL(TAVOUnitTrans, 0, { run(f, 0, 1.5f); }),
        },
        [] { return std::make_shared<Accounts>(); },
        {"/tmp", "/etc", "/usr/tavo/etc"},
    };
}

}  // namespace every_call
