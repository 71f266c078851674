// The gate to files in directories in which everybody may create names.
#include "core/detail/trusted_file.h"

#include "support/test.h"

namespace {

constexpr uid_t kSomebody = 1000;

mode_t ModeOf(const std::string &path)
{
    struct stat st {};
    EXPECT_EQ(::lstat(path.c_str(), &st), 0) << path;
    return st.st_mode & 07777;
}

class TrustedFile : public testing::Test {
  protected:
    void SetUp() override
    {
        ASSERT_EQ(::mkdir(public_.c_str(), 0777), 0);
        ASSERT_EQ(::chmod(public_.c_str(), 01777), 0);
        test::WriteFile(victim_, "kept");
        test::WriteFile(probe_, "x");
        if (::chown(probe_.c_str(), kSomebody, 0) != 0)
            GTEST_SKIP() << "cannot give files away here";
        ::unlink(probe_.c_str());
    }

    const test::ScratchDir dir_;
    const std::string public_ = dir_ / "public", victim_ = dir_ / "victim", probe_ = dir_ / "probe",
                      name_ = public_ + "/name";
};

TEST_F(TrustedFile, OpensOnlyOurOwnFilesInPublicFolders)
{
    const struct {
        const char *what;
        std::function<int()> plant;
        int error;  // 0: opened
    } rows[] = {
        {"nothing", [] { return 0; }, 0},
        {"our file", [&] { return test::WriteFile(name_, "old"), 0; }, 0},
        {"a link", [&] { return ::symlink(victim_.c_str(), name_.c_str()); }, ELOOP},
        {"a link to nothing", [&] { return ::symlink((dir_ / "made").c_str(), name_.c_str()); }, ELOOP},
        {"a second name of our file", [&] { return ::link(victim_.c_str(), name_.c_str()); }, EPERM},
        {"somebody's file", [&] { return test::WriteFile(name_, "old"), ::chown(name_.c_str(), kSomebody, 0); }, EPERM},
        {"a FIFO", [&] { return ::mkfifo(name_.c_str(), 0666); }, EINVAL},
        {"a folder", [&] { return ::mkdir(name_.c_str(), 0755); }, EISDIR},
    };
    for (const auto &row : rows) {
        for (const int flags : {O_RDWR | O_CREAT | O_APPEND, O_RDWR | O_CREAT | O_TRUNC, O_RDWR | O_CREAT}) {
            ASSERT_EQ(row.plant(), 0) << row.what;
            errno = 0;
            const tavo::Fd fd = tavo::OpenTrusted(name_.c_str(), flags);
            const int error = errno;
            EXPECT_EQ(static_cast<bool>(fd), row.error == 0) << row.what;
            if (row.error != 0) {
                // The kernel itself may refuse another user's file (fs.protected_regular).
                EXPECT_THAT(error, testing::AnyOf(row.error, EACCES)) << row.what;
            } else {
                EXPECT_EQ(test::ReadFile(name_), (flags & O_TRUNC) || row.what[0] == 'n' ? "" : "old") << row.what;
            }
            EXPECT_EQ(test::ReadFile(victim_), "kept") << row.what;
            ASSERT_EQ(::remove(name_.c_str()), 0);
        }
    }
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("public", "victim")) << "nothing is made through a link";
}

TEST_F(TrustedFile, FollowsLinksAndOpensDevicesElsewhere)
{
    const std::string link = dir_ / "link", dangling = dir_ / "dangling";
    ASSERT_EQ(::symlink(victim_.c_str(), link.c_str()), 0);
    ASSERT_EQ(::symlink((dir_ / "made").c_str(), dangling.c_str()), 0);
    EXPECT_TRUE(tavo::OpenTrusted(link.c_str(), O_RDONLY));
    EXPECT_TRUE(tavo::OpenTrusted("/dev/null", O_WRONLY));
    EXPECT_FALSE(tavo::OpenTrustedRegular("/dev/null", O_WRONLY));
    EXPECT_TRUE(tavo::OpenTrusted(dangling.c_str(), O_WRONLY | O_CREAT));
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("dangling", "link", "made", "public", "victim"));
}

TEST_F(TrustedFile, ModesDoNotDependOnTheUmask)
{
    for (const mode_t mask : {0u, 022u, 077u, 0777u}) {
        const mode_t before = ::umask(mask);
        const bool made = tavo::OpenTrusted(name_.c_str(), O_WRONLY | O_CREAT, 0666) &&
                          tavo::OpenTrusted(probe_.c_str(), O_WRONLY | O_CREAT, 0600);
        ::umask(before);
        EXPECT_TRUE(made) << mask;
        EXPECT_EQ(ModeOf(name_), 0644u) << mask;
        EXPECT_EQ(ModeOf(probe_), 0600u) << mask;
        ::unlink(name_.c_str());
        ::unlink(probe_.c_str());
    }
    test::WriteFile(name_, "old", 0600);
    EXPECT_TRUE(tavo::OpenTrusted(name_.c_str(), O_WRONLY | O_CREAT));
    EXPECT_EQ(ModeOf(name_), 0600u) << "what exists keeps its mode";
}

TEST_F(TrustedFile, MovesForeignFilesAside)
{
    const std::string below = name_ + "/below";
    const struct {
        const char *what;
        std::function<int()> plant;
        bool foreign;
    } rows[] = {
        {"nothing", [] { return 0; }, false},
        {"our file", [&] { return test::WriteFile(name_, "ours"), 0; }, false},
        {"our folder", [&] { return ::mkdir(name_.c_str(), 0755); }, false},
        {"a file", [&] { return test::WriteFile(name_, ""), ::chown(name_.c_str(), kSomebody, 0); }, true},
        {"a link", [&] { return ::symlink(victim_.c_str(), name_.c_str()) | ::lchown(name_.c_str(), kSomebody, 0); },
         true},
        {"a second name of our file", [&] { return ::link(victim_.c_str(), name_.c_str()); }, true},
        {"a FIFO", [&] { return ::mkfifo(name_.c_str(), 0666) | ::chown(name_.c_str(), kSomebody, 0); }, true},
        {"a folder",
         [&] {
             return ::mkdir(name_.c_str(), 0755) | ::mkdir(below.c_str(), 0755) | ::chown(name_.c_str(), kSomebody, 0);
         },
         true},
    };
    for (const auto &row : rows) {
        ASSERT_EQ(row.plant(), 0) << row.what;
        struct stat before {
        }, after{};
        ::lstat(name_.c_str(), &before);
        const std::string aside = tavo::MoveForeignAside(name_);
        if (!row.foreign) {
            EXPECT_THAT(aside, testing::IsEmpty()) << row.what;
            ::remove(name_.c_str());
            continue;
        }
        EXPECT_THAT(aside, testing::StartsWith(name_ + ".foreign-")) << row.what;
        EXPECT_NE(::lstat(name_.c_str(), &after), 0) << row.what;
        ASSERT_EQ(::lstat(aside.c_str(), &after), 0) << row.what;
        EXPECT_EQ(after.st_ino, before.st_ino) << row.what;
        if (S_ISDIR(after.st_mode)) {
            EXPECT_EQ(::rmdir((aside + "/below").c_str()), 0) << "with everything in it";
        }
        EXPECT_EQ(::remove(aside.c_str()), 0) << row.what;
    }
    EXPECT_EQ(test::ReadFile(victim_), "kept");
}

}  // namespace
