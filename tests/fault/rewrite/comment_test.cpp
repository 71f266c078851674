// TLIBFileComment where its scratch file can be used: on the file system of /etc/skel.
#include "tavo_file.h"

#include "interposed_calls.h"
#include "support/appliance_root.h"
#include "support/captured_log.h"
#include "support/failing_malloc.h"
#include "support/fault_state.h"
#include "support/scratch_dir.h"

#include <gmock/gmock.h>

#include <cerrno>

#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

using test::Call;

namespace {

constexpr const char *kScratch = "/etc/skel/tempErrTLIBFileComment";
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
        ::unlink(kScratch);
        Restore();
    }
    void TearDown() override { ::unlink(kFile); }

    static void Restore()
    {
        test::WriteFile(kFile, kOldText, 0640);
        ASSERT_EQ(::chown(kFile, 0, 1), 0);
    }

    static bool IsScratchGone() { return ::access(kScratch, F_OK) != 0; }
};

TEST_F(Comment, ComesFromTheScratchFileAndKeepsOwnerAndMode)
{
    EXPECT_EQ(TLIBFileComment(kFile, "key"), 1);
    EXPECT_STREQ(test::RenamedFrom(), kScratch);
    EXPECT_EQ(test::ReadFile(kFile), kNewText);
    struct stat st;
    ASSERT_EQ(::stat(kFile, &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0640u);
    EXPECT_EQ(st.st_gid, 1u);
    EXPECT_TRUE(IsScratchGone());
}

TEST_F(Comment, FailsWithTheOldTextAndNoScratchFile)
{
    const struct {
        Call call;
        int code;
    } rows[] = {{Call::write, ERR_WRITE_FAILED},
                {Call::fchown, ERR_WRITE_FAILED},
                {Call::fchmod, ERR_WRITE_FAILED},
                {Call::fsync_file, ERR_WRITE_FAILED},
                {Call::rename, ERR_RENAME_FAILED}};
    for (const auto &row : rows) {
        test::FailCalls(row.call, EIO);
        EXPECT_EQ(TLIBFileComment(kFile, "key"), -1);
        test::FailCalls(Call::none, 0);
        EXPECT_EQ(test::LastFault(), (test::Fault{row.code, "file_comment"}));
        EXPECT_EQ(test::ReadFile(kFile), kOldText);
        EXPECT_TRUE(IsScratchGone());
    }
    test::CapturedLog log;
    test::FailCalls(Call::fsync_directory, EIO);
    EXPECT_EQ(TLIBFileComment(kFile, "key"), 1) << "the file is the new one already";
    test::FailCalls(Call::none, 0);
    EXPECT_THAT(log.Texts(), testing::ElementsAre(testing::MatchesRegex("file_comment:[0-9]+ Failed to sync.*")));
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

TEST_F(Comment, ADeathAnywhereLeavesOneOfTheTwoFilesAndNothingForNewHomes)
{
    for (int n = 1;; ++n) {
        ASSERT_LT(n, 20);
        Restore();
        const pid_t child = ::fork();
        if (child == 0) {
            test::DieAtCall(n);
            ::_exit(TLIBFileComment(kFile, "key") == 1 ? 0 : 1);
        }
        int status = 0;
        ASSERT_EQ(::waitpid(child, &status, 0), child);
        ASSERT_TRUE(WIFEXITED(status));
        const std::string text = test::ReadFile(kFile);
        EXPECT_TRUE(text == kOldText || text == kNewText) << n << ": " << text;
        // The next call removes files of dead processes.
        Restore();
        EXPECT_EQ(TLIBFileComment(kFile, "key"), 1) << n;
        EXPECT_EQ(test::ReadFile(kFile), kNewText) << n;
        EXPECT_TRUE(IsScratchGone()) << n;
        if (WEXITSTATUS(status) == 0)
            break;
        EXPECT_EQ(WEXITSTATUS(status), test::kDied) << n;
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
