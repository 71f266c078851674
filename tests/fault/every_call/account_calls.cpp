// Users, groups, quotas and their stores: alice and bob, who are in the group staff, and a user with an accent.
#include "arguments.h"
#include "support/test.h"

namespace every_call {
namespace {

constexpr const char *kStore = "/tmp/every_call/store.db";
constexpr const char *kDevice = "/dev/vg1/volume_1";
constexpr const char *kNoHash = "00000000000000000000000000000000";

Made<TAVOUserFree> OneUser(const char *name, int uid = -1)
{
    Made<TAVOUserFree> user;
    TAVOUserAlloc(user, name, "secret", uid, uid < 0 ? -1 : 100, "described", "", "", -1, 0, "", 0);
    return Made<TAVOUserFree>{user.Release()};
}

Made<TAVOGroupFree> OneGroup(const char *name, int gid = -1)
{
    const char *const members[] = {"alice", "bob", nullptr};
    Made<TAVOGroupFree> group;
    TAVOGroupAlloc2(group, name, gid, members);
    return Made<TAVOGroupFree>{group.Release()};
}

struct Accounts {
    Accounts()
    {
        const test::CapturedLog quiet;
        std::filesystem::create_directories("/tmp/every_call");
        for (const char *name : {"alice", "bob", "zo\xC3\xAB"})
            EXPECT_EQ(TAVOUserSetOne(nullptr, OneUser(name)), 0);
        EXPECT_EQ(TAVOGroupSet(nullptr, OneGroup("staff")), 0);
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
Made<TAVOBDbClose> Store(const char *path = kStore)
{
    return Made<TAVOBDbClose>{TAVOBDbOpen(path, O_RDWR, 1)};
}

struct UserStores {
    Made<TAVOBDbClose> name = Store(TAVO_USER_DB_NAME), misc = Store(TAVO_USER_DB_MISC),
                       shadow = Store(TAVO_USER_DB_SHADOW), smb = Store(TAVO_USER_DB_SMB),
                       uid = Store(TAVO_USER_DB_UID);
    TAVOUSERDB all = {name, misc, shadow, smb, uid};

    operator TAVOUSERDB *() { return &all; }
};

struct GroupStores {
    Made<TAVOBDbClose> name = Store(TAVO_GROUP_DB_NAME), gid = Store(TAVO_GROUP_DB_ID),
                       desc = Store(TAVO_GROUP_DB_DESC);
    TAVOGROUPDB all = {name, gid, desc};

    operator TAVOGROUPDB *() { return &all; }
};

}  // namespace

Family AccountFamily()
{
    return {
        "Accounts",
        {
            // Stores.
            CALL(TAVOBDbClose, 0, Store().Release()),
            CALL(TAVOBDbConfSyncTimeGet, 0, Store(), Var<int32_t>()),
            CALL(TAVOBDbConfSyncTimeSet, 0, Store(), int64_t{2000}),
            CALL(TAVOBDbCursorGet, 0, Store(), 1, Made<TAVOBDbFree>(), Var<int>(), Made<TAVOBDbFree>(), Var<int>()),
            CALL(TAVOBDbCursorSetType, 0, Store(), int{TAVO_BDB_CURSOR_NEXT}),
            CALL(TAVOBDbDelete, 0, Store(), "key", 3),
            CALL(TAVOBDbDeprecatedGet, 0, Store(), Var<int32_t>{7}),
            CALL(TAVOBDbDeprecatedSet, 0, Store(), 1),
            CALL(TAVOBDbDomainExpireTimeDelete, 0, Store()),
            CALL(TAVOBDbDomainExpireTimeGet, 0, Store(), Var<int32_t>()),
            CALL(TAVOBDbDomainExpireTimeSet, 0, Store()),
            BODY(TAVOBDbFree, 0,
                 {
                     void *value = nullptr;
                     TAVOBDbGet(Store(), "key", 3, &value, Var<int>());
                     run(f, value);
                 }),
            CALL(TAVOBDbGet, 0, Store(), "key", 3, Made<TAVOBDbFree>(), Var<int>()),
            CALL(TAVOBDbIsNeedToDomainRebuild, kAnswers, Store()),
            CALL(TAVOBDbIsNeedToRebuild, kAnswers, Store(), int64_t{1000}),
            BODY(TAVOBDbOpen, 0, { TAVOBDbClose(run(f, kStore, O_RDWR, 1)); }),
            CALL(TAVOBDbSet, 0, Store(), "another", 7, "value", 5),

            // Users.
            CALL(BlTLIBIsUserName, kZeroFails | kNoCode, "alice"),
            CALL(TAVOConfGetUserLimit, 0),
            CALL(TAVOUserAgingSet, 0, "alice", 1, 90, 14),
            CALL(TAVOUserAlloc, 0, Made<TAVOUserFree>(), "carol", "x", -1, -1, "", "", "", -1, 0, "", 0),
            CALL(TAVOUserCheckExpired, 0, "alice"),
            CALL(TAVOUserDBDump, 0, UserStores()),
            CALL(TAVOUserDBGetFreeUid, 0, UserStores()),
            CALL(TAVOUserDBSet, 0, UserStores(), nullptr, OneUser("carol", 2000)),
            CALL(TAVOUserDelete, kLeavesCode, Texts{"bob"}, 1),
            CALL(TAVOUserEnum, 0, ListOf({}), 1),
            CALL(TAVOUserEnumByPrefix, 0, ListOf({}), 1, "al"),
            CALL(TAVOUserEnumBySubstr, 0, ListOf({}), 1, "lic"),
            BODY(TAVOUserExpiredDateFill, 0,
                 {
                     const Made<TAVOUserFree> user = OneUser("alice");
                     run(f, user.made, "2037/1/31");
                     run.Show(user.made->nExpired);
                 }),
            CALL(TAVOUserExpiredDateGet, 0, OneUser("alice"), Text<32>(), 32),
            CALL(TAVOUserFree, 0, OneUser("carol").Release()),
            CALL(TAVOUserGet, 0, "alice", Made<TAVOUserFree>()),
            CALL(TAVOUserGet, 0, "zo\xC3\xAB", Made<TAVOUserFree>()),
            CALL(TAVOUserGetByUID, 0, 1025, Made<TAVOUserFree>()),
            CALL(TAVOUserGetValidUserList, 0, Texts{"alice", "nobody there", nullptr}, Text<64>(), 64),
            CALL(TAVOUserIsExpired, 0, 1),
            CALL(TAVOUserLockSet, 0, "alice", 1),
            CALL(TAVOUserPrivilegeGet, 0, "alice"),
            CALL(TAVOUserRandomNumMap2Seed, 0, 1),
            CALL(TAVOUserRemoveTmpFiles, kAnswers),
            CALL(TAVOUserSet, kLeavesCode, Texts{nullptr}, OneUser("dave"), 1),
            CALL(TAVOUserSetOne, kLeavesCode, "bob", OneUser("robert")),
            CALL(TAVOUserSetOne, kLeavesCode, "bob", OneUser("bob")),
            CALL(TAVOUserSetPasswd, kLeavesCode, OneUser("alice"), Texts{"$1$abcdefgh$NGjcfXeLg.0fo4FzMqUTu1"},
                 Texts{kNoHash}, Texts{kNoHash}, 1),
            CALL(TAVOUserTotalNum, 0, 1),
            CALL(TLIBSmbLmHash, 0, "secret", Array<unsigned char, 16>()),
            CALL(TLIBSmbMd4Hash, 0, "secret", Array<unsigned char, 16>()),

            // Groups.
            CALL(BlTLIBIsGroupName, kZeroFails | kNoCode, "staff"),
            CALL(TAVOGroupAlloc, 0, Made<TAVOGroupFree>(), "staff:x:65540:alice,bob"),
            CALL(TAVOGroupAlloc2, 0, Made<TAVOGroupFree>(), "crew", 65541, Texts{"alice", nullptr}),
            CALL(TAVOGroupDBGetFreeGid, 0, GroupStores()),
            CALL(TAVOGroupDBSet, 0, GroupStores(), nullptr, OneGroup("crew", 70000)),
            CALL(TAVOGroupDelete, kLeavesCode, Texts{"staff"}, 1),
            CALL(TAVOGroupDescGet, 0, "staff", Text<64>(), 64),
            CALL(TAVOGroupDescSet, 0, "staff", "new hands"),
            CALL(TAVOGroupEnum, 0, ListOf({}), 1),
            CALL(TAVOGroupEnumByPrefix, 0, ListOf({}), 1, "st"),
            CALL(TAVOGroupEnumBySubstr, 0, ListOf({}), 1, "taf"),
            CALL(TAVOGroupFree, 0, OneGroup("staff").Release()),
            CALL(TAVOGroupGet, 0, "staff", Made<TAVOGroupFree>()),
            CALL(TAVOGroupGetByGID, 0, 101, Made<TAVOGroupFree>()),
            CALL(TAVOGroupListMember, 0, "staff", ListOf({})),
            CALL(TAVOGroupListMember, 0, "users", ListOf({})),
            CALL(TAVOGroupSet, 0, nullptr, OneGroup("crew")),
            CALL(TAVOGroupSet, 0, "staff", OneGroup("crew")),
            CALL(TAVOGroupTotalNum, 0, 1),
            CALL(TAVOUserModifyGroup, 0, HashOf({{"alice", "alicia"}})),

            // Quotas.
            CALL(TAVOQuotaClean, kAnswers, ListOf({"alice"}), kDevice),
            CALL(TAVOQuotaCleanAllVols, kAnswers, ListOf({"alice"})),
            CALL(TAVOQuotaFmtGet, kAnswers, kDevice),
            CALL(TAVOQuotaGet, 0, "alice", kDevice, Var<TAVOQUOTA>()),
            CALL(TAVOQuotaInit, kAnswers, 1),
            CALL(TAVOQuotaOff, kAnswers, 1),
            CALL(TAVOQuotaSet, 0, "alice", kDevice, Var<float>{10}),
            CALL(TAVOSupportQUOTA, kAnswers),
            CALL(TAVOUnitTrans, 0, 0, 1.5f),
        },
        [] { return std::make_shared<Accounts>(); },
        {"/tmp", "/etc", "/usr/tavo/etc"},
    };
}

}  // namespace every_call
