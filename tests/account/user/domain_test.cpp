// Accounts of a domain stand in the stores alone: they are read like others, outlive a rebuild while they are fresh, and
// never reach the text files. And the log names lines of the text files that a change does not write again.
#include "tavo_bdb.h"
#include "tavo_group.h"
#include "tavo_user.h"

#include "account/account_story.h"
#include "account/user/user_fixture.h"
#include "support/domain_entries.h"
#include "support/test.h"

namespace {

constexpr char kUser[] = "DOM\\eva";

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
    ASSERT_NO_FATAL_FAILURE(test::PutDomainEntries(200));
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
    ASSERT_NO_FATAL_FAILURE(test::PutDomainEntries(310));
    ASSERT_TRUE(test::GetUser(kUser));
    SomebodyEditsTheFiles();
    EXPECT_FALSE(test::GetUser(kUser));
    EXPECT_EQ(TLIBErrGet(), ERR_NO_SUCH_USER);
}

using DroppedLines = test::AccountStory;

TEST_F(DroppedLines, AreNamedInTheLog)
{
    test::WriteFile("/etc/passwd", test::FileText("/etc/passwd") +
                                       "# comment\n+::::::\neight:x:905:100:::/bin/sh:more\nroot:secret:0:0:::\n");
    test::WriteFile("/etc/group", "root:x:0:\n# comment\nfive:x:7:a:b\n:x:8:\nDOM\\a:x:9:\nroot:x:10:\nlp:x:7:\n");
    test::WriteFile("/etc/group_desc", "no colon\n:no name\nghost:x\nlp:print\nlp:again\nROOT:in capitals\n");
    TELL(test::AddUser({.name = "alice", .password = "x"}));
    TELL(test::AddGroup("one", 9000));
    TELL(test::AddGroup("two", 9000));
}

}  // namespace
