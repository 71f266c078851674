// TLIBFileComment where its scratch file can be used: on the file system of /etc/skel. Deaths and failing calls there are
// in the tests of all rewrites.
#include "tavo_file.h"

#include "interposed_calls.h"
#include "support/failing_malloc.h"
#include "support/test.h"
#include "writers.h"

using test::Call;

namespace {

constexpr const char *kFile = "/etc/commented.conf";
constexpr const char *kOldText = "a=1\nkey=1\n key=2\n";
constexpr const char *kNewText = "a=1\n;key=1\n; key=2\n";

class Comment : public testing::Test {
  protected:
    void SetUp() override
    {
        if (test::RootForm().empty())
            GTEST_SKIP() << "only in an appliance root";
        ::mkdir("/etc/skel", 0755);
        ::unlink(test::kScratch);
        Restore();
    }
    void TearDown() override { ::unlink(kFile); }

    static void Restore() { test::WriteFile(kFile, kOldText); }

    static bool IsScratchGone() { return ::access(test::kScratch, F_OK) != 0; }
};

TEST_F(Comment, ComesFromTheScratchFile)
{
    EXPECT_EQ(TLIBFileComment(kFile, "key"), 1);
    EXPECT_STREQ(test::RenamedFrom(), test::kScratch);
    EXPECT_EQ(test::ReadFile(kFile), kNewText);
}

// Without the lock the scratch file is not used, and the file is rewritten like any other.
TEST_F(Comment, LeavesNoScratchFileThatCannotBeLocked)
{
    for (const int error : {EIO, ENOLCK, ENOSYS}) {
        Restore();
        test::FailCalls(Call::flock, error);
        EXPECT_EQ(TLIBFileComment(kFile, "key"), 1) << error;
        test::FailCalls(Call::none, 0);
        EXPECT_EQ(test::ReadFile(kFile), kNewText) << error;
        EXPECT_TRUE(IsScratchGone()) << error;
    }
}

TEST_F(Comment, OutOfMemory)
{
    test::EachAllocation faults;
    while (faults.Next()) {
        Restore();
        test::ForgetFault();
        faults.Arm();
        const int result = TLIBFileComment(kFile, "key");
        faults.Disarm();
        EXPECT_EQ(result, faults.Fired() ? -1 : 1);
        EXPECT_EQ(TLIBErrGet(), faults.Fired() ? ERR_OUT_OF_MEMORY : ERR_SUCCESS);
        EXPECT_EQ(test::ReadFile(kFile), faults.Fired() ? kOldText : kNewText);
        EXPECT_EQ(faults.LeftAllocated(), 0);
        EXPECT_TRUE(IsScratchGone());
    }
    EXPECT_GT(faults.Count(), 2);
}

}  // namespace
