// Running programs for a limited time.
#include "tavo_lock.h"
#include "tavo_proc.h"

#include "support/own_child.h"
#include "support/test.h"

#include <chrono>
#include <climits>

#include <sys/resource.h>
#include <sys/syscall.h>
#include <syslog.h>

using test::LastFault;
using namespace std::chrono_literals;

namespace {

bool is_undying = false;  // no signal ends a process
pid_t undying = 0;        // the last process that did not get one

}  // namespace

extern "C" int kill(pid_t pid, int signal) noexcept
{
    if (!is_undying)
        return static_cast<int>(::syscall(SYS_kill, pid, signal));
    undying = pid > 0 ? pid : undying;
    return 0;
}

namespace {

const test::Fault kExpired = {ERR_TIMER_EXPIRED, "proc_timed_exec"};

std::chrono::milliseconds TimeOf(const std::function<void()> &what)
{
    const auto start = std::chrono::steady_clock::now();
    what();
    return std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() - start);
}

void HaveChildrenDie()
{
    for (int i = 0; i < 40; ++i) {
        if (::fork() == 0) {
            ::usleep(static_cast<useconds_t>(i) * 40000);
            ::_exit(1);
        }
    }
}

void BlockChildSignal()
{
    sigset_t mask;
    sigemptyset(&mask);
    sigaddset(&mask, SIGCHLD);
    ::sigprocmask(SIG_BLOCK, &mask, nullptr);
}

TEST(TimedExec, Refuses)
{
    test::CapturedLog log;
    const struct {
        int seconds;
        const char *program;
        const char *name;
    } rows[] = {
        {0, "/bin/true", "cSeconds"}, {-1, "/bin/true", "cSeconds"}, {5, nullptr, "szProgram"}, {5, "", "szProgram"}};
    for (const auto &row : rows) {
        log.Clear();
        test::ForgetFault();
        EXPECT_EQ(TLIBTimedExec(row.seconds, row.program, NULL), -1);
        EXPECT_EQ(LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "proc_timed_exec"}));
        ASSERT_EQ(log.Lines().size(), 1u);
        EXPECT_EQ(log.Lines()[0].priority, LOG_ERR);
        EXPECT_THAT(log.Lines()[0].text, testing::MatchesRegex("proc_timed_exec:[0-9]+ Invaild Argument \\(" +
                                                               std::string(row.name) + "\\)=\\[(0|-1)\\]\n"));
    }
}

TEST(TimedExec, StatusIsTheResult)
{
    test::ForgetFault();
    EXPECT_EQ(TLIBTimedExec(60, "/bin/sh", "-c", "exit 3", NULL), 3);
    EXPECT_EQ(TLIBTimedExec(60, "/nonexistent", NULL), 255);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(TLIBTimedExec(60, "/bin/sh", "-c", "kill -KILL $$", NULL), -1);
    EXPECT_EQ(LastFault(), (test::Fault{ERR_OP_FAILURE, "proc_timed_exec"}));
    EXPECT_EQ(TLIBTimedExec(INT_MAX, "/bin/true", NULL), 0);
    EXPECT_EQ(TLIBTimedExec(60, "/bin/sh", "-c", "exit $#", "0", "1", "2", "3", "4", "5", "6", "7", "8", "9", "10",
                            "11", "12", "13", "14", "15", "16", "17", "18", "19", "20", "21", "22", "23", "24", "25",
                            "26", "27", "not", "these", NULL),
              27);
}

// A program succeeds a tenth of a second before the limit and fails a tenth after it, whatever other children die
// meanwhile and whatever the caller has set for SIGCHLD. All cases run at the same time, each in its own process.
TEST(TimedExec, TheLimitIsExact)
{
    const struct {
        std::function<void()> prepare;
        const char *what;
    } surroundings[] = {
        {[] {}, "plain"},
        {HaveChildrenDie, "other children die"},
        {[] { ::signal(SIGCHLD, SIG_IGN); }, "SIGCHLD ignored"},
        {[] { ::signal(SIGCHLD, SIG_IGN), HaveChildrenDie(); }, "SIGCHLD ignored, others die"},
        {BlockChildSignal, "SIGCHLD blocked"},
        {[] { TLIBTimedExec(9, "/bin/true", NULL), HaveChildrenDie(); }, "called before"},
    };
    struct Case {
        const char *program;  // how long it takes
        int result;
        std::chrono::milliseconds earliest;
        std::chrono::milliseconds latest;
    };
    const Case cases[] = {{"0.9", 0, 890ms, 1000ms}, {"1.1", -1, 1000ms, 1095ms}};
    const auto is_right = [](const Case &one) {
        test::ForgetFault();
        int result = -2;
        const auto time = TimeOf([&] { result = TLIBTimedExec(1, "/bin/sleep", one.program, NULL); });
        return result == one.result && LastFault() == (result == -1 ? kExpired : test::Fault{}) &&
               time >= one.earliest && time <= one.latest;
    };
    struct Run {
        std::string what;
        std::unique_ptr<test::OwnChild> child;
    };
    const auto finish = [](Run &run) {
        EXPECT_EQ(run.child->Status(), 0) << run.what;
    };
    std::vector<Run> runs;
    for (const auto &row : surroundings) {
        for (const Case &one : cases) {
            runs.push_back({row.what + std::string(": ") + one.program, std::make_unique<test::OwnChild>([&] {
                                row.prepare();
                                // A loaded machine may be late once, not three times.
                                ::_exit(is_right(one) || is_right(one) || is_right(one) ? 0 : 1);
                            })});
            // A single processor has no time for a dozen at once.
            if (::sysconf(_SC_NPROCESSORS_ONLN) == 1) {
                finish(runs.back());
                runs.pop_back();
            }
        }
    }
    for (Run &run : runs)
        finish(run);
}

TEST(TimedExec, KillsTheProgramsChildrenAndLeavesNoZombie)
{
    const test::ScratchDir dir;
    const std::string out = dir / "pid";
    EXPECT_EQ(
        TLIBTimedExec(1, "/bin/sh", "-c", "trap '' TERM; sleep 60 & echo $! > $0; wait; sleep 60", out.c_str(), NULL),
        -1);
    EXPECT_EQ(LastFault(), kExpired);
    EXPECT_TRUE(test::HasNoChildren());
    const pid_t grandchild = std::stoi(test::ReadFile(out));
    for (int i = 0; i < 100 && BlTLIBProcAlive(grandchild); ++i) {
        const std::string stat = "/proc/" + std::to_string(grandchild) + "/stat";
        if (::access(stat.c_str(), R_OK) == 0 && test::ReadFile(stat).find(") Z ") != std::string::npos)
            break;  // dead, and its new parent is slow
        ::usleep(10000);
        ASSERT_LT(i, 99) << "the program's own child lives on";
    }
}

// Whether a child that ends remains a zombie.
bool LeavesZombie()
{
    const pid_t child = ::fork();
    if (child == 0)
        ::_exit(0);
    siginfo_t ended = {};
    for (int i = 0; i < 5000 && ended.si_pid == 0; ++i) {
        if (::waitid(P_PID, static_cast<id_t>(child), &ended, WEXITED | WNOHANG | WNOWAIT) != 0)
            return false;
        ::usleep(1000);
    }
    return true;
}

TEST(TimedExec, TheHandlerStaysWithoutZombiesWhenSigchldIsIgnored)
{
    if (test::InChild([] {
            const test::ChildAction kernel_collects(SIG_DFL, SA_NOCLDWAIT);
            return LeavesZombie() ? 1 : 0;
        }) != 0)
        GTEST_SKIP() << "this emulator knows no SA_NOCLDWAIT";
    EXPECT_EQ(test::InChild([] {
                  ::signal(SIGCHLD, SIG_IGN);
                  TLIBTimedExec(9, "/bin/true", NULL);
                  struct sigaction left;
                  ::sigaction(SIGCHLD, nullptr, &left);
                  if (left.sa_handler == SIG_IGN || left.sa_handler == SIG_DFL)
                      return 1;
                  return LeavesZombie() ? 2 : 0;
              }),
              0);
}

// One pipe per process: a forked child must not take its parent's rings, and after a daemon has closed all its
// descriptors their numbers belong to other files.
TEST(TimedExec, ThePipeIsTheProcessesOwn)
{
    TLIBTimedExec(9, "/bin/true", NULL);
    test::OwnChild other([] { ::_exit(TLIBTimedExec(9, "/bin/sh", "-c", "sleep 0.3; exit 7", NULL)); });
    int result = -2;
    EXPECT_LT(TimeOf([&] { result = TLIBTimedExec(9, "/bin/sh", "-c", "sleep 0.3; exit 8", NULL); }), 2s);
    EXPECT_EQ(result, 8);
    EXPECT_EQ(other.Status(), 7 << 8);

    const test::ScratchDir dir;
    const std::string path = dir / "file";
    EXPECT_EQ(test::InChild([&] {
                  TLIBTimedExec(9, "/bin/true", NULL);
                  for (int fd = 3; fd < 64; ++fd)
                      ::close(fd);
                  for (int fd = 3; fd < 16; ++fd) {
                      if (::open(path.c_str(), O_RDWR | O_CREAT, 0600) != fd)
                          return 1;
                  }
                  if (::fork() == 0)
                      ::_exit(0);
                  ::waitpid(-1, nullptr, 0);
                  return TLIBTimedExec(9, "/bin/sh", "-c", "exit 6", NULL) == 6 && ::close(3) == 0 && ::close(15) == 0
                             ? 0
                             : 2;
              }),
              0);
    EXPECT_EQ(test::ReadFile(path), "");
}

// A program that cannot be read for now, as on a disk that does not answer: another process holds a lease on it, which
// the kernel revokes after 45 seconds.
class HeldUpProgram {
  public:
    HeldUpProgram()
    {
        test::WriteFile(path_, "#!/bin/sh\nexit 0\n", 0755);
        holder_ = std::make_unique<test::OwnChild>([this] {
            ::signal(SIGIO, SIG_IGN);
            const int fd = ::open(path_.c_str(), O_RDWR | O_CLOEXEC);
            const char *const name = ::fcntl(fd, F_SETLEASE, F_WRLCK) == 0 ? "held" : "not held";
            ::close(::open((dir_ / name).c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0644));
            ::pause();
        });
        EXPECT_TRUE(test::Eventually([this] { return dir_.Names().size() == 2; }));
    }

    const char *Path() const { return path_.c_str(); }
    bool IsHeldUp() const { return ::access((dir_ / "held").c_str(), F_OK) == 0; }

  private:
    const test::ScratchDir dir_;
    const std::string path_ = dir_ / "program";
    std::unique_ptr<test::OwnChild> holder_;
};

TEST(TimedExec, TheLimitCountsWhileTheProgramIsRead)
{
    const HeldUpProgram program;
    if (!program.IsHeldUp())
        GTEST_SKIP() << "no leases on this file system";
    int result = 0;
    const auto time = TimeOf([&] { result = TLIBTimedExec(1, program.Path(), NULL); });
    EXPECT_EQ(result, -1);
    EXPECT_EQ(LastFault(), kExpired);
    EXPECT_GE(time, 990ms);
    EXPECT_LT(time, 4s);
}

// A program that waits for a dead disk does not die, and the caller does not wait for it.
TEST(TimedExec, AChildThatCannotBeKilledIsLeftToALaterCall)
{
    is_undying = true;
    const auto time = TimeOf([] { EXPECT_EQ(TLIBTimedExec(1, "/bin/sleep", "60", NULL), -1); });
    is_undying = false;
    EXPECT_EQ(LastFault(), kExpired);
    EXPECT_LT(time, 5s);
    ASSERT_GT(undying, 0);
    ASSERT_EQ(::kill(undying, SIGKILL), 0) << "it is left";
    siginfo_t ended = {};
    ASSERT_EQ(::waitid(P_PID, static_cast<id_t>(undying), &ended, WEXITED | WNOWAIT), 0);
    EXPECT_EQ(TLIBExec("/bin/true", NULL), 0);
    EXPECT_TRUE(test::HasNoChildren());
}

// The child of a waiting program must not hold locks that its parent has released by dying.
TEST(TimedExec, ACopyOfTheCallerHoldsNoLock)
{
    if (test::RootForm().empty())
        GTEST_SKIP() << "only in an appliance root";
    const HeldUpProgram program;
    if (!program.IsHeldUp())
        GTEST_SKIP() << "no leases on this file system";
    {
        test::OwnChild caller([&] {
            if (ErrTLIBFileLock(TAVO_LOCK_RC | TAVO_LOCK_EXCLUSIVE, 0) == 0)
                TLIBTimedExec(60, program.Path(), NULL);
        });
        ASSERT_TRUE(test::Eventually([] {
            const bool held = ErrTLIBFileLock(TAVO_LOCK_RC | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 0) != 0;
            if (!held)
                ErrTLIBFileUnlock(TAVO_LOCK_RC);
            return held;
        }));
        ::usleep(300000);  // the copy runs its program
    }
    EXPECT_EQ(ErrTLIBFileLock(TAVO_LOCK_RC | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 2), 0);
    ErrTLIBFileUnlock(TAVO_LOCK_RC);
}

TEST(TimedExec, AbortsWithoutDescriptorsForThePipe)
{
    test::OwnChild child([] {
        const struct rlimit few = {3, 3};
        const struct rlimit no_core = {0, 0};
        ::setrlimit(RLIMIT_CORE, &no_core);
        for (int fd = 3; fd < 64; ++fd)
            ::close(fd);
        ::setrlimit(RLIMIT_NOFILE, &few);
        TLIBTimedExec(9, "/bin/true", NULL);
    });
    const int status = child.Status();
    EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGABRT) << status;
}

}  // namespace
