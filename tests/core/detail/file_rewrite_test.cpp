// Rewriting files: what is kept of the old file, which file is replaced, and what a failure leaves.
#include "core/detail/file_rewrite.h"

#include "core/detail/file_target.h"
#include "support/test.h"

#include <sys/xattr.h>

using testing::ElementsAre;

namespace {

int Rewrite(const std::string &path, std::string_view text, mode_t mode = 0666)
{
    tavo::FileRewrite rewrite;
    const int code = rewrite.Open(path.c_str());
    if (code && !rewrite.IsMissing())
        return code;
    return rewrite.Replace(text, mode);
}

struct stat StateOf(const std::string &path)
{
    struct stat st {};
    EXPECT_EQ(::lstat(path.c_str(), &st), 0) << path;
    return st;
}

class FileRewriteTest : public testing::Test {
  protected:
    const test::ScratchDir dir_;
    const std::string file_ = dir_ / "file";
};

TEST_F(FileRewriteTest, KeepsOwnerModeAndAttributes)
{
    for (const mode_t mode : {0600u, 0644u, 0400u, 04755u, 02640u, 0u}) {
        test::WriteFile(file_, "old\n");
        if (::chown(file_.c_str(), 1234, 4321) != 0)
            GTEST_SKIP() << "cannot give files away here";
        ASSERT_EQ(::chmod(file_.c_str(), mode), 0);
        const bool attributes = ::setxattr(file_.c_str(), "trusted.label", "secret", 6, 0) == 0;
        EXPECT_EQ(Rewrite(file_, "new\n"), 0);
        const struct stat st = StateOf(file_);
        EXPECT_EQ(st.st_mode & 07777, mode);
        EXPECT_EQ(st.st_uid, 1234u);
        EXPECT_EQ(st.st_gid, 4321u);
        EXPECT_EQ(test::ReadFile(file_), "new\n");
        char label[16];
        if (attributes) {
            EXPECT_EQ(::getxattr(file_.c_str(), "trusted.label", label, sizeof label), 6);
        }
        ::unlink(file_.c_str());
    }
}

TEST_F(FileRewriteTest, CreatesWithTheSameModeUnderEveryUmask)
{
    for (const mode_t mask : {0u, 022u, 027u, 0777u}) {
        const mode_t old = ::umask(mask);
        EXPECT_EQ(Rewrite(dir_ / "settings", "a\n", 0666), 0);
        EXPECT_EQ(Rewrite(dir_ / "secret", "a\n", 0600), 0);
        EXPECT_EQ(::umask(old), mask);
        EXPECT_EQ(StateOf(dir_ / "settings").st_mode & 07777, 0644u) << mask;
        EXPECT_EQ(StateOf(dir_ / "secret").st_mode & 07777, 0600u) << mask;
        EXPECT_THAT(dir_.Names(), ElementsAre("secret", "settings"));
        ::unlink((dir_ / "settings").c_str());
        ::unlink((dir_ / "secret").c_str());
    }
}

TEST_F(FileRewriteTest, FollowsLinksAndKeepsThem)
{
    ASSERT_EQ(::mkdir((dir_ / "real").c_str(), 0755), 0);
    test::WriteFile(dir_ / "real/file", "old");
    ASSERT_EQ(::symlink("real", (dir_ / "dirlink").c_str()), 0);
    ASSERT_EQ(::symlink("dirlink/file", (dir_ / "link").c_str()), 0);
    ASSERT_EQ(::symlink("link", (dir_ / "chain").c_str()), 0);
    ASSERT_EQ(::symlink((dir_ / "real/made").c_str(), (dir_ / "dangling").c_str()), 0);
    ASSERT_EQ(::symlink("loop", (dir_ / "loop").c_str()), 0);

    EXPECT_EQ(Rewrite(dir_ / "chain", "new"), 0);
    EXPECT_EQ(Rewrite(dir_ / "dangling", "made"), 0);
    EXPECT_EQ(test::ReadFile(dir_ / "real/file"), "new");
    EXPECT_EQ(test::ReadFile(dir_ / "real/made"), "made");
    EXPECT_EQ(Rewrite(dir_ / "loop", "x"), ERR_OPEN_FAILED);
    for (const char *link : {"link", "chain", "dangling", "loop", "dirlink"})
        EXPECT_TRUE(S_ISLNK(StateOf(dir_ / link).st_mode)) << link;
    EXPECT_THAT(dir_.Names(), ElementsAre("chain", "dangling", "dirlink", "link", "loop", "real"));
}

TEST_F(FileRewriteTest, RefusesAnythingButAFile)
{
    ASSERT_EQ(::mkfifo((dir_ / "fifo").c_str(), 0644), 0);
    for (const std::string &path : {dir_ / "fifo", dir_.Path(), dir_ / "none/file", dir_ / "none/", std::string(),
                                    std::string("/dev/null"), dir_ / "fifo/x", dir_ / std::string(300, 'n')})
        EXPECT_EQ(Rewrite(path, "x"), ERR_OPEN_FAILED) << path;
    EXPECT_THAT(dir_.Names(), ElementsAre("fifo"));
}

TEST_F(FileRewriteTest, CutsAHardLink)
{
    test::WriteFile(file_, "old");
    ASSERT_EQ(::link(file_.c_str(), (dir_ / "other").c_str()), 0);
    EXPECT_EQ(Rewrite(file_, "new"), 0);
    EXPECT_EQ(test::ReadFile(dir_ / "other"), "old");
}

TEST_F(FileRewriteTest, ReadsTheWholeOldText)
{
    for (const size_t size : {0u, 1u, 4095u, 4096u, 70000u}) {
        const std::string old(size, 'x');
        test::WriteFile(file_, old);
        tavo::FileRewrite rewrite;
        std::string text = "left over";
        ASSERT_EQ(rewrite.Open(file_.c_str()), 0);
        EXPECT_TRUE(rewrite.Read(text));
        EXPECT_EQ(text, old);
    }
    tavo::FileRewrite sizeless;
    std::string text;
    ASSERT_EQ(sizeless.Open("/proc/self/status"), 0);
    EXPECT_TRUE(sizeless.Read(text));
    EXPECT_THAT(text, testing::HasSubstr("VmPeak"));
}

TEST_F(FileRewriteTest, RemovesAnUnusedTemporaryFile)
{
    test::WriteFile(file_, "old");
    {
        tavo::TempFile temp;
        ASSERT_TRUE(temp.CreateBeside(file_));
        EXPECT_EQ(StateOf(temp.Path()).st_mode & 07777, 0600u);
        EXPECT_EQ(::fcntl(temp.Descriptor(), F_GETFD) & FD_CLOEXEC, FD_CLOEXEC);
        EXPECT_THAT(dir_.Names(), ElementsAre("file", testing::MatchesRegex("file\\..{6}")));
    }
    EXPECT_THAT(dir_.Names(), ElementsAre("file"));
}

}  // namespace
