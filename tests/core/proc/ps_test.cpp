// Finding processes, with a ps that knows -I and with one that does not.
#include "tavo_proc.h"

#include "support/descriptors.h"
#include "support/failing_malloc.h"
#include "support/own_child.h"
#include "support/planted_name.h"
#include "support/test.h"

#include <sys/mman.h>
#include <sys/syscall.h>

namespace {

// The shell's last command; other processes write it.
char *const last_command =
    static_cast<char *>(::mmap(nullptr, 65536, PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
const char *other_ps = nullptr;  // runs in place of /bin/ps

}  // namespace

extern "C" int execve(const char *program, char *const words[], char *const variables[])
{
    static char command[65536];
    if (words[0] && std::strcmp(words[0], "sh") == 0 && words[1] && words[2]) {
        std::snprintf(last_command, 65536, "%s", words[2]);
        if (other_ps && std::strncmp(words[2], "/bin/ps ", 8) == 0) {
            std::snprintf(command, sizeof command, "%s %s", other_ps, words[2] + 8);
            char *const other[] = {words[0], words[1], command, nullptr};
            return static_cast<int>(::syscall(SYS_execve, program, other, variables));
        }
    }
    return static_cast<int>(::syscall(SYS_execve, program, words, variables));
}

namespace {

class Ps : public testing::Test {
  protected:
    void SetUp() override
    {
        if (test::RootForm().empty())
            GTEST_SKIP() << "only in an appliance root";
        SKIP_WITHOUT_PROC();
        test::WriteFile(dir_ / "ps", "#!/bin/sh\necho 'error: unsupported SysV option' >&2\nexit 1\n", 0755);
        scratch_ = "/tmp/tempTLIBPs" + std::to_string(::getpid());
        for (int i = 0; i < 5; ++i) {
            children_.push_back(
                std::make_unique<test::OwnChild>([] { ::execl("/bin/sleep", "sleep", "271828", nullptr); }));
            pids_.push_back(children_.back()->Pid());
        }
        for (const pid_t pid : pids_) {
            const std::string path = "/proc/" + std::to_string(pid) + "/cmdline";
            ASSERT_TRUE(test::Eventually([&] { return test::ReadFile(path).find("271828") != std::string::npos; }));
        }
    }
    void TearDown() override { other_ps = nullptr; }

    // Runs a case with both kinds of ps.
    template <class Body>
    void WithEither(Body body)
    {
        const std::string poor = dir_ / "ps";
        for (const char *ps : {static_cast<const char *>(nullptr), poor.c_str()}) {
            SCOPED_TRACE(ps ? "a ps without -I" : "a ps with -I");
            other_ps = ps;
            test::ForgetFault();
            const int descriptors = test::OpenDescriptors();
            body();
            EXPECT_EQ(test::OpenDescriptors(), descriptors);
            EXPECT_FALSE(::access(scratch_.c_str(), F_OK) == 0) << "the scratch file is still there";
        }
    }

    const test::ScratchDir dir_;
    std::string scratch_;
    std::vector<std::unique_ptr<test::OwnChild>> children_;
    std::vector<pid_t> pids_;
};

TEST_F(Ps, CountsAllAndStoresWhatFits)
{
    WithEither([&] {
        std::vector<pid_t> found(7, -5);
        EXPECT_EQ(TLIBPs("sleep 271828", found.data(), 7), 5);
        std::vector<pid_t> expected = pids_;
        std::sort(expected.begin(), expected.end());
        expected.insert(expected.end(), {-5, -5});
        std::sort(found.begin(), found.begin() + 5);
        EXPECT_EQ(found, expected);

        std::vector<pid_t> few(3, -5);
        EXPECT_EQ(TLIBPs("sleep 271828", few.data(), 2), 5);
        EXPECT_THAT(pids_, testing::IsSupersetOf({few[0], few[1]}));
        EXPECT_EQ(few[2], -5);
        EXPECT_EQ(TLIBPs("sleep 271828", nullptr, 0), 5);
        EXPECT_EQ(TLIBPs("nobody runs this", nullptr, 0), 0) << "not the search itself, either";
        EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    });
}

TEST_F(Ps, TheCommandIsUnchanged)
{
    TLIBPs("smbd -D", nullptr, 0);
    EXPECT_EQ(last_command, "/bin/ps -I | /bin/grep 'smbd -D' > " + scratch_ + " 2>&1");
}

TEST_F(Ps, PatternsAreExpressionsForGrepAndTextWithoutIt)
{
    EXPECT_EQ(TLIBPs("sl[e]ep 27.828$", nullptr, 0), 5);
    EXPECT_EQ(TLIBPs("^ *[0-9]* sleep 271828$", nullptr, 0), 5)
        << "the search does not find itself, and that is not a failure";
    other_ps = "/bin/false";
    EXPECT_EQ(TLIBPs("sl[e]ep 27.828$", nullptr, 0), 0);
}

TEST_F(Ps, HostilePatterns)
{
    const std::string canary = dir_ / "canary";
    WithEither([&] {
        for (const std::string &pattern : std::vector<std::string>{
                 "x'; touch " + canary + "; '", "$(touch " + canary + ")", "`touch " + canary + "`", std::string("-r"),
                 std::string("--help"), "x\ntouch " + canary + "\n"}) {
            EXPECT_GE(TLIBPs(pattern.c_str(), nullptr, 0), 0) << pattern;
            EXPECT_NE(::access(canary.c_str(), F_OK), 0) << pattern;
        }
        std::vector<pid_t> found(10, 0);
        EXPECT_EQ(TLIBPs("no such \\(", found.data(), 10), 0) << "a complaint of grep is not a process";
    });
    test::OwnChild dashed([] { ::execl("/bin/sh", "sh", "-c", "sleep 60; : -zq9", nullptr); });
    ::usleep(50000);
    WithEither([&] { EXPECT_EQ(TLIBPs("-zq9", nullptr, 0), 1); });
}

TEST_F(Ps, Refuses)
{
    EXPECT_EQ(TLIBPs(std::string(1025, 'x').c_str(), nullptr, 0), -1) << "grep would take minutes for a longer one";
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "ps"}));
    EXPECT_EQ(TLIBPs(std::string(1024, 'x').c_str(), nullptr, 0), 0);
}

TEST_F(Ps, OutOfMemory)
{
    WithEither([&] {
        std::vector<pid_t> found(8);
        test::EachAllocation faults;
        while (faults.Next()) {
            test::ForgetFault();
            faults.Arm();
            const int count = TLIBPs("sleep 271828", found.data(), 8);
            faults.Disarm();
            EXPECT_EQ(faults.LeftAllocated(), 0);
            if (count == 5)
                continue;  // a stream works without a buffer, too
            EXPECT_EQ(count, -1);
            EXPECT_TRUE(TLIBErrGet() == ERR_OUT_OF_MEMORY || TLIBErrGet() == ERR_READ_FAILED) << TLIBErrGet();
            ASSERT_NE(::access(scratch_.c_str(), F_OK), 0);
        }
        EXPECT_GT(faults.Count(), 3);
        test::ForgetFault();
    });
}

// The name of the scratch file can be guessed, and everybody may create it first.
TEST_F(Ps, TrapsAtTheScratchFile)
{
    const std::string victim = dir_ / "victim";
    test::WriteFile(victim, "kept");
    const struct {
        std::function<int()> plant;
        const char *what;
    } rows[] = {{[&] { return ::symlink(victim.c_str(), scratch_.c_str()); }, "link"},
                {[&] { return test::WriteFile(scratch_, "1 sleep 271828\n"), 0; }, "file"},
                {[&] { return ::mkfifo(scratch_.c_str(), 0666); }, "FIFO"}};
    for (const auto &row : rows) {
        ASSERT_EQ(row.plant(), 0) << row.what;
        EXPECT_EQ(TLIBPs("sleep 271828", nullptr, 0), 5) << "our own stale " << row.what;
        EXPECT_NE(::access(scratch_.c_str(), F_OK), 0) << row.what;
    }
    ASSERT_EQ(::mkdir(scratch_.c_str(), 0755), 0);
    EXPECT_EQ(TLIBPs("sl[e]ep 27.828$", nullptr, 0), 5) << "a directory of ours has the name";
    EXPECT_EQ(::rmdir(scratch_.c_str()), 0);
    for (const test::Plant plant : test::kPlants) {
        test::PlantAt(scratch_, plant);
        struct stat before, after;
        ASSERT_EQ(::lstat(scratch_.c_str(), &before), 0);
        EXPECT_EQ(TLIBPs("sl[e]ep 27.828$", nullptr, 0), 5) << plant;
        ASSERT_EQ(::lstat(scratch_.c_str(), &after), 0) << plant;
        EXPECT_EQ(after.st_ino, before.st_ino) << plant;
        EXPECT_EQ(after.st_size, before.st_size) << plant;
        if (plant == test::Plant::link) {
            EXPECT_EQ(test::ReadFile(scratch_ + ".target"), "kept");
        }
        test::RemovePlanted(scratch_);
    }
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(test::ReadFile(victim), "kept");
    for (const auto &entry : std::filesystem::directory_iterator("/tmp"))
        EXPECT_FALSE(entry.path().string().starts_with(scratch_)) << entry.path() << " is still there";
}

}  // namespace
