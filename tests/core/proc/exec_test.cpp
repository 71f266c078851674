// Running programs: their status, their inheritance, their leftovers.
#include "tavo_lock.h"
#include "tavo_proc.h"

#include "support/descriptors.h"
#include "support/own_child.h"
#include "support/test.h"

#include <cstdarg>

#include <dlfcn.h>
#include <sys/resource.h>
#include <sys/syscall.h>

using test::Fault;
using test::LastFault;

namespace {

int wait_error = 0;          // errno of the next waitpid
bool is_old_kernel = false;  // without close_range and pidfd_open

}  // namespace

extern "C" {

pid_t waitpid(pid_t pid, int *status, int options)
{
    if (wait_error != 0) {
        errno = std::exchange(wait_error, 0);
        return -1;
    }
    return ::wait4(pid, status, options, nullptr);
}

long syscall(long number, ...)
{
    using Call = long (*)(long, ...);
    static const Call real = reinterpret_cast<Call>(::dlsym(RTLD_NEXT, "syscall"));
    if (is_old_kernel && (number == SYS_close_range || number == SYS_pidfd_open)) {
        errno = ENOSYS;
        return -1;
    }
    va_list args;
    va_start(args, number);
    long values[6];
    for (long &value : values)
        value = va_arg(args, long);
    va_end(args);
    return real(number, values[0], values[1], values[2], values[3], values[4], values[5]);
}
}

namespace {

int RunShell(const char *script)
{
    return TLIBExec("/bin/sh", "-c", script, NULL);
}

int RunVector(const char *program, std::vector<std::string> words, int wait = 1)
{
    std::vector<char *> vector;
    for (std::string &word : words)
        vector.push_back(word.data());
    vector.push_back(nullptr);
    return TLIBExecv(program, vector.data(), wait);
}

int StatusOf(pid_t pid)
{
    int status = -1;
    ::wait4(pid, &status, 0, nullptr);
    return status;
}

// The environment of a program, written by a shell to the file $0.
constexpr char kDescribe[] = R"(exec > "$0"
for fd in 0 1 2; do readlink /proc/self/fd/$fd; done | head -1
pwd
tr '\0' '\n' < /proc/$$/environ
set -- $(cat /proc/$$/stat); [ $6 != $$ ] || echo leads a session
)";

TEST(Exec, StatusIsTheResult)
{
    const Fault failed = {ERR_OP_FAILURE, "proc_exec"};
    const struct {
        const char *script;
        int result;
        Fault fault;
    } rows[] = {{"exit 0", 0, {}},
                {"exit 3", 3, {}},
                {"exit 255", 255, {}},
                {"kill -TERM $$", -1, failed},
                {"kill -KILL $$", -1, failed}};
    for (const auto &row : rows) {
        test::ForgetFault();
        EXPECT_EQ(RunShell(row.script), row.result) << row.script;
        EXPECT_EQ(LastFault(), row.fault) << row.script;
        test::ForgetFault();
        EXPECT_EQ(RunVector("/bin/sh", {"sh", "-c", row.script}), row.result) << row.script;
        EXPECT_EQ(LastFault(), Fault{}) << "TLIBExecv sets no code";
    }
    EXPECT_EQ(TLIBExec("/bin/sh", "-c", "exit $#", "name", "one"), 1) << "four arguments need no NULL";
    EXPECT_EQ(TLIBSystem("exit 3"), 3 << 8);
    EXPECT_EQ(TLIBSystem(nullptr), 0);
}

TEST(Exec, UnexecutableFiles)
{
    const test::ScratchDir dir;
    test::WriteFile(dir / "text", "no program\n", 0755);
    test::WriteFile(dir / "plain", "#!/bin/sh\n", 0644);
    const std::string text = dir / "text", plain = dir / "plain";
    test::ForgetFault();
    for (const char *program : {"/nonexistent", "sh", "/tmp", "", text.c_str(), plain.c_str(), (const char *)nullptr}) {
        EXPECT_EQ(TLIBExec(program, NULL), 255) << program;
        EXPECT_EQ(RunVector(program, {"x"}), -1) << program;
        const pid_t pid = TLIBBackgroundExec(program, NULL);
        ASSERT_GT(pid, 0);
        const int status = StatusOf(pid);
        EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGABRT && !WCOREDUMP(status)) << program << status;
    }
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(dir.Names().size(), 2u) << "no core";
}

TEST(Exec, NoProcessLeft)
{
    EXPECT_EQ(
        test::InChild([] {
            const struct rlimit none = {0, 0};
            if (::setrlimit(RLIMIT_NPROC, &none) != 0 || ::setresuid(54321, 54321, 54321) != 0)
                return 1;
            const bool exec = TLIBExec("/bin/true", NULL) == -1 && LastFault() == Fault{ERR_OP_FAILURE, "proc_exec"};
            test::ForgetFault();
            const bool execv = RunVector("/bin/true", {"true"}) == -1 && RunVector("/bin/true", {"true"}, 0) == -1 &&
                               TLIBErrGet() == ERR_SUCCESS;
            const bool background = TLIBBackgroundExec("/bin/true", NULL) == -1 &&
                                    LastFault() == Fault{ERR_OP_FAILURE, "proc_background_exec"};
            const bool timed =
                TLIBTimedExec(1, "/bin/true", NULL) == -1 && LastFault() == Fault{ERR_OP_FAILURE, "proc_timed_exec"};
            return exec && execv && background && timed ? 0 : 2;
        }),
        0);
}

TEST(Exec, Surroundings)
{
    SKIP_WITHOUT_PROC();
    ::setenv("PATH", "/bin:/own", 1);
    ::setenv("SECRET", "x", 1);
    ::signal(SIGPIPE, SIG_IGN);
    const test::ScratchDir dir;
    ASSERT_EQ(::chdir(dir.Path().c_str()), 0);
    const std::string out = dir / "out";

    EXPECT_EQ(TLIBExec("/bin/sh", "-c", kDescribe, out.c_str(), NULL), 0);
    EXPECT_EQ(test::ReadFile(out), "/dev/null\n/\nPATH=/bin:/own\nleads a session\n");
    EXPECT_EQ(TLIBTimedExec(60, "/bin/sh", "-c", kDescribe, out.c_str(), NULL), 0);
    EXPECT_EQ(test::ReadFile(out), "/dev/null\n/\nPATH=/bin:/own\nleads a session\n");

    const std::string kept = "/dev/null\n" + dir.Path() + "\n";
    EXPECT_EQ(StatusOf(TLIBBackgroundExec("/bin/sh", "-c", kDescribe, out.c_str(), NULL)), 0);
    EXPECT_EQ(test::ReadFile(out).find(kept), 0u);
    EXPECT_NE(test::ReadFile(out).find("SECRET=x\n"), std::string::npos);
    EXPECT_NE(test::ReadFile(out).find("leads a session\n"), std::string::npos);
    EXPECT_EQ(RunVector("/bin/sh", {"sh", "-c", kDescribe, out}), 0);
    EXPECT_EQ(test::ReadFile(out).find(kept), 0u);
    EXPECT_NE(test::ReadFile(out).find("SECRET=x\n"), std::string::npos);
    EXPECT_EQ(test::ReadFile(out).find("leads a session\n"), std::string::npos);

    ::unsetenv("PATH");
    EXPECT_EQ(TLIBExec("/bin/sh", "-c", "/bin/cat /proc/$$/environ > $0; exit 5", out.c_str(), NULL), 5);
    EXPECT_EQ(test::ReadFile(out), "");
    ::setenv("PATH", "/usr/sbin:/usr/bin:/sbin:/bin", 1);
    ::signal(SIGPIPE, SIG_DFL);
    ASSERT_EQ(::chdir("/"), 0);
}

// A program that is started while a settings file is locked must not keep the lock, least of all a daemon.
TEST(Exec, DescriptorsAndLocks)
{
    SKIP_WITHOUT_PROC();
    const test::ScratchDir dir;
    const std::string out = dir / "out";
    const int open_one = ::open("/etc/passwd", O_RDONLY);  // not close-on-exec
    ASSERT_EQ(ErrTLIBFileLock(0x406, 0), 0);
    const int lock = ::fileno(rgslckList[7].pfLock);
    const std::string tell = "for fd in " + std::to_string(open_one) + " " + std::to_string(lock) +
                             "; do test -e /proc/$$/fd/$fd && echo open; done > $0; exit 0";
    const auto run = [&](const char *what) {
        const std::string found = test::ReadFile(out);
        EXPECT_EQ(ErrTLIBFileUnlock(0), 0) << what;
        return found;
    };
    EXPECT_EQ(TLIBExec("/bin/sh", "-c", tell.c_str(), out.c_str(), NULL), 0);
    EXPECT_EQ(run("TLIBExec"), "open\n");
    EXPECT_EQ(RunVector("/bin/sh", {"sh", "-c", tell, out}), 0);
    EXPECT_EQ(run("TLIBExecv"), "open\n");
    EXPECT_EQ(TLIBTimedExec(60, "/bin/sh", "-c", tell.c_str(), out.c_str(), NULL), 0);
    EXPECT_EQ(run("TLIBTimedExec"), "open\n");
    for (const bool old : {false, true}) {
        is_old_kernel = old;
        EXPECT_EQ(StatusOf(TLIBBackgroundExec("/bin/sh", "-c", tell.c_str(), out.c_str(), NULL)), 0);
        EXPECT_EQ(run("TLIBBackgroundExec"), "");
    }
    is_old_kernel = false;

    const pid_t daemon = TLIBBackgroundExec("/bin/sleep", "60", NULL);
    ErrTLIBFileUnlock(0x400);
    EXPECT_EQ(test::InChild([] { return ErrTLIBFileLock(0x406, 0); }), 0) << "the daemon holds the lock";
    ::kill(daemon, SIGKILL);
    StatusOf(daemon);
    ::close(open_one);
}

// A caller without standard descriptors: /dev/null gets one of their numbers and must stay.
TEST(Exec, FromAProcessWithoutStandardDescriptors)
{
    SKIP_WITHOUT_PROC();
    const test::ScratchDir dir;
    const std::string out = dir / "out";
    EXPECT_EQ(test::InChild([&] {
                  for (int fd = 0; fd <= 2; ++fd)
                      ::close(fd);
                  return TLIBExec(
                      "/bin/sh", "-c",
                      "ls /proc/self/fd | wc -w > $0; readlink /proc/$$/fd/0 >> $0; readlink /proc/$$/fd/2 >> $0",
                      out.c_str(), NULL);
              }),
              0);
    EXPECT_EQ(test::ReadFile(out), "4\n/dev/null\n/dev/null\n") << "0, 1, 2 and the directory of ls";
}

void OnChild(int)
{
}

TEST(Exec, SignalsAreAtTheirDefaults)
{
    SKIP_WITHOUT_PROC();
    const test::ScratchDir dir;
    const std::string out = dir / "out";
    const std::string script = "grep -E '^Sig(Blk|Ign)' /proc/$$/status | tr -d '\\n\\t' > " + out;
    struct sigaction saved;
    ::sigaction(SIGHUP, nullptr, &saved);
    ::signal(SIGHUP, SIG_IGN);
    ::signal(SIGUSR2, OnChild);
    sigset_t mask;
    sigemptyset(&mask);
    sigaddset(&mask, SIGUSR1);
    ::sigprocmask(SIG_BLOCK, &mask, nullptr);

    EXPECT_EQ(RunShell(script.c_str()), 0);
    EXPECT_EQ(test::ReadFile(out), "SigBlk:0000000000000000SigIgn:0000000000000000");
    EXPECT_EQ(TLIBTimedExec(60, "/bin/sh", "-c", script.c_str(), NULL), 0);
    EXPECT_EQ(test::ReadFile(out), "SigBlk:0000000000000000SigIgn:0000000000000000");
    EXPECT_EQ(RunVector("/bin/sh", {"sh", "-c", script}), 0);
    EXPECT_EQ(test::ReadFile(out), "SigBlk:0000000000000200SigIgn:0000000000000001") << "the caller's own";

    struct sigaction left;
    ::sigaction(SIGUSR2, nullptr, &left);
    EXPECT_EQ(left.sa_handler, OnChild) << "a child resets its own handlers, not the caller's";
    sigset_t now;
    ::sigprocmask(SIG_UNBLOCK, &mask, &now);
    EXPECT_TRUE(sigismember(&now, SIGUSR1) && !sigismember(&now, SIGUSR2));
    ::sigaction(SIGHUP, &saved, nullptr);
    ::signal(SIGUSR2, SIG_DFL);
}

TEST(Exec, ReturnsTheStatusForEverySigchldSetting)
{
    const struct {
        void (*handler)(int);
        int flags;
    } rows[] = {{SIG_IGN, 0}, {SIG_DFL, SA_NOCLDWAIT}, {OnChild, SA_NOCLDWAIT | SA_RESTART}, {OnChild, 0}};
    for (const auto &row : rows) {
        const test::ChildAction set(row.handler, row.flags);
        EXPECT_EQ(RunShell("exit 4"), 4);
        EXPECT_EQ(RunVector("/bin/sh", {"sh", "-c", "exit 4"}), 4);
        struct sigaction left;
        ::sigaction(SIGCHLD, nullptr, &left);
        EXPECT_EQ(left.sa_handler, row.handler);
        EXPECT_EQ(left.sa_flags & (SA_NOCLDWAIT | SA_RESTART), row.flags);
    }
    const struct {
        int error;
        int result;
    } errors[] = {{EINTR, 6}, {ECHILD, 0}, {EINVAL, -1}};
    for (const auto &row : errors) {
        wait_error = row.error;
        EXPECT_EQ(RunShell("exit 6"), row.result) << row.error;
        while (::wait4(-1, nullptr, 0, nullptr) > 0) {
        }
    }
}

TEST(Exec, RunsLeakNothing)
{
    TLIBTimedExec(60, "/bin/true", NULL);
    const auto before = test::OpenDescriptors();
    for (int i = 0; i < 250; ++i) {
        TLIBExec("/bin/true", NULL);
        TLIBExec("/nonexistent", NULL);
        TLIBTimedExec(60, "/bin/false", NULL);
        RunVector("/bin/true", {"true"});
    }
    EXPECT_EQ(test::OpenDescriptors(), before);
    EXPECT_TRUE(test::HasNoChildren());

    EXPECT_EQ(RunVector("/bin/sh", {"sh", "-c", "exit 9"}, 0), 0);
    EXPECT_EQ(StatusOf(-1), 9 << 8) << "not waited for: it is the caller's";
}

}  // namespace
