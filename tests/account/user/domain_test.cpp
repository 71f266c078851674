// Accounts of a domain stand in the stores alone: they are read like others, outlive a rebuild while they are fresh, and
// never reach the text files. And the log names lines of the text files that a change does not write again.
#include "tavo_bdb.h"
#include "tavo_group.h"
#include "tavo_user.h"

#include "account/user/user_fixture.h"
#include "support/captured_log.h"

#include <gtest/gtest.h>

#include <cstring>
#include <ctime>

#include <fcntl.h>
#include <unistd.h>

namespace {

constexpr char kUser[] = "DOM\\eva";

void Put(const char *store, std::string key, std::string value)
{
    TAVOBDB *db = TAVOBDbOpen(store, O_RDWR, 1);
    ASSERT_TRUE(db) << store;
    EXPECT_EQ(TAVOBDbSet(db, key.c_str(), static_cast<int>(key.size()) + 1, value.c_str(),
                         static_cast<int>(value.size()) + 1),
              0);
    EXPECT_EQ(TAVOBDbClose(db), 0);
}

// As the domain's client does, so many seconds ago.
void Refresh(int age)
{
    ASSERT_TRUE(test::GetUser("root"));
    ASSERT_GE(TAVOGroupTotalNum(TAVO_GROUP_LOCAL), 0);
    Put(TAVO_USER_DB_NAME, "DOM\\EVA", "DOM\\eva:x:70001:70000:Eva:/home/eva:/bin/sh");
    Put(TAVO_USER_DB_UID, "070001", "DOM\\EVA");
    Put(TAVO_GROUP_DB_NAME, "DOM\\CREW", "DOM\\crew:x:70000:DOM\\eva");
    for (const char *store : {TAVO_USER_DB_NAME, TAVO_GROUP_DB_NAME}) {
        TAVOBDB *db = TAVOBDbOpen(store, O_RDWR, 1);
        ASSERT_TRUE(db);
        const int32_t time = static_cast<int32_t>(std::time(nullptr)) - age;
        EXPECT_EQ(TAVOBDbSet(db, TAVO_BDB_KEY_EXPIRE, TAVO_BDB_KEY_EXPIRE_LEN, &time, sizeof time), 0);
        EXPECT_EQ(TAVOBDbClose(db), 0);
    }
}

void ExpectReadLikeOthers()
{
    const test::User user = test::GetUser("dom\\EVA");
    ASSERT_TRUE(user) << TLIBErrGet();
    EXPECT_STREQ(user->szName, kUser);
    EXPECT_EQ(user->nKind, TAVO_USER_KIND_DOMAIN);
    EXPECT_EQ(user->nPrivilege, TAVO_USER_PRIVILEGE_DOMAIN);
    EXPECT_EQ(TAVOUserPrivilegeGet(kUser), TAVO_USER_PRIVILEGE_DOMAIN);
    EXPECT_EQ(TAVOUserCheckExpired(kUser), 0);
    TAVOUSER *by_id = nullptr;
    EXPECT_EQ(TAVOUserGetByUID(70001, &by_id), 0);
    TAVOUserFree(by_id);
    EXPECT_EQ(TAVOUserTotalNum(TAVO_USER_DOMAIN), 1);
    TAVOGROUP *group = nullptr;
    EXPECT_EQ(TAVOGroupGet("DOM\\crew", &group), 0);
    TAVOGroupFree(group);
}

void SomebodyEditsTheFiles()
{
    test::WriteFile("/etc/passwd", test::FileText("/etc/passwd") + "ext:x:901:100:a \\ b:/:/bin/sh\n");
    test::WriteFile("/etc/group", test::FileText("/etc/group") + "ext:x:901:\n");
}

TEST(DomainAccounts, AreReadLikeOthersAndOutliveARebuildWhileFresh)
{
    ASSERT_NO_FATAL_FAILURE(Refresh(200));
    ASSERT_NO_FATAL_FAILURE(ExpectReadLikeOthers());
    SomebodyEditsTheFiles();
    ASSERT_TRUE(test::GetUser("ext"));
    ASSERT_NO_FATAL_FAILURE(ExpectReadLikeOthers());
    ASSERT_EQ(test::AddUser({.name = "alice", .password = "x"}), 0);
    ASSERT_NO_FATAL_FAILURE(ExpectReadLikeOthers());
    for (const char *path : test::kAccountFiles)
        EXPECT_EQ(test::FileText(path).find("DOM"), std::string::npos) << path;
    // They are changed in their domain.
    EXPECT_EQ(test::Rename(kUser, "eva"), ERR_NO_SUCH_USER);
    EXPECT_EQ(test::DeleteUser(kUser), 0);
    ASSERT_NO_FATAL_FAILURE(ExpectReadLikeOthers());
}

TEST(DomainAccounts, GoWithARebuildWhenStale)
{
    ASSERT_NO_FATAL_FAILURE(Refresh(310));
    ASSERT_TRUE(test::GetUser(kUser));
    SomebodyEditsTheFiles();
    EXPECT_FALSE(test::GetUser(kUser));
    EXPECT_EQ(TLIBErrGet(), ERR_NO_SUCH_USER);
}

TEST(DroppedLines, AreNamedInTheLog)
{
    const test::CapturedLog log;
    test::WriteFile("/etc/passwd", test::FileText("/etc/passwd") +
                                       "# comment\n+::::::\neight:x:905:100:::/bin/sh:more\nroot:secret:0:0:::\n");
    ASSERT_EQ(test::AddUser({.name = "alice", .password = "x"}), 0);
    std::string lines;
    for (const std::string &text : log.Texts())
        if (text.find("is not written again") != text.npos)
            lines += text + "\n";
    for (const char *name : {"[+]", "[eight]", "[root]"})
        EXPECT_NE(lines.find(name), std::string::npos) << name << " in " << lines;
    EXPECT_EQ(lines.find("comment"), std::string::npos);
    EXPECT_EQ(lines.find("secret"), std::string::npos);
    EXPECT_EQ(test::FileText("/etc/passwd").find("eight"), std::string::npos);
}

}  // namespace
