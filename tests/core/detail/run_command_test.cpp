// Running commands: status, environment, leftovers.
#include "core/detail/run_command.h"

#include "core/detail/command_output.h"
#include "core/detail/log.h"
#include "support/descriptors.h"
#include "support/own_child.h"
#include "support/test.h"

using tavo::CommandOutput;
using tavo::RunCommand;

namespace {

std::vector<std::string> LinesOf(const std::string &command)
{
    std::vector<std::string> lines;
    CommandOutput output(command);
    for (std::string line; output.Next(line);)
        lines.push_back(line);
    EXPECT_EQ(output.Status(), 0) << command;
    return lines;
}

int StatusOf(const std::string &command)
{
    CommandOutput output(command);
    return output.Status();
}

void OnChild(int)
{
}

TEST(RunCommand, ReturnsTheStatusForEverySigchldSetting)
{
    const struct {
        const char *command;
        int status;
    } rows[] = {{"true", 0}, {"exit 3", 3}, {"exit 255", 255}, {"kill -9 $$", -1}, {"/nonexistent 2>/dev/null", 127}};
    const struct {
        void (*handler)(int);
        int flags;
    } actions[] = {{SIG_DFL, 0}, {SIG_IGN, 0}, {SIG_DFL, SA_NOCLDWAIT}, {OnChild, 0}, {OnChild, SA_NOCLDWAIT}};
    for (const auto &action : actions) {
        const test::ChildAction set(action.handler, action.flags);
        for (const auto &row : rows) {
            EXPECT_EQ(RunCommand(row.command), row.status) << row.command;
            EXPECT_EQ(StatusOf(row.command), row.status) << row.command;
        }
        struct sigaction left;
        ::sigaction(SIGCHLD, nullptr, &left);
        EXPECT_EQ(left.sa_handler, action.handler);
        EXPECT_EQ(left.sa_flags & SA_NOCLDWAIT, action.flags);
    }
}

TEST(ToolWords, GoToTheLogAfterTheLinesOfTheCaller)
{
    const test::CapturedLog log;
    testing::internal::CaptureStderr();
    testing::internal::CaptureStdout();
    {
        CommandOutput output("echo line; echo first >&2; printf 'se\\033cond' >&2; exit 3");
        std::string line;
        EXPECT_TRUE(output.Next(line));
        EXPECT_EQ(output.Status(), 3);
        const tavo::ToolWords words;
        EXPECT_EQ(RunCommand("echo lost; echo third >&2", words), 0);
        tavo::LogError("%s:%d stated");
    }
    EXPECT_EQ(testing::internal::GetCapturedStderr() + testing::internal::GetCapturedStdout(), "");
    std::string text;
    for (const test::LoggedLine &line : log.Lines())
        text += std::to_string(line.priority) + line.text.substr(line.text.find(' ')) + "\n";
    EXPECT_EQ(text, "3 stated\n7 third\n7 first\n7 se\\x1Bcond\n");
}

// A daemon may have closed its standard descriptors. The first file that a tool opens, such as a disk, must not become
// its standard output.
TEST(RunCommand, ClosedStandardDescriptorsAreTheNullDevice)
{
    const test::ScratchDir dir;
    const std::string command =
        "a=$(readlink /proc/$$/fd/0); b=$(readlink /proc/$$/fd/1); c=$(readlink /proc/$$/fd/2); "
        "echo $a $b $c >" +
        dir / "descriptors";
    for (const std::vector<int> &closed : {std::vector<int>{0, 1, 2}, {1}, {2}, {1, 2}, {0, 2}}) {
        EXPECT_EQ(test::InChild([&] {
                      const int null = ::open("/dev/null", O_RDWR | O_CLOEXEC);
                      for (const int fd : {0, 1, 2})
                          ::dup2(null, fd);
                      for (const int fd : closed)
                          ::close(fd);
                      return RunCommand(command);
                  }),
                  0);
        EXPECT_EQ(test::ReadFile(dir / "descriptors"), "/dev/null /dev/null /dev/null\n") << closed.size();
    }
}

// A caller that ignores SIGCHLD never waits: a child that ends while a command runs must not remain a zombie.
TEST(RunCommand, LeavesNoZombieWhenSigchldIsIgnored)
{
    const test::ChildAction ignore(SIG_IGN, 0);
    const pid_t other = ::fork();
    if (other == 0) {
        ::usleep(50000);
        ::_exit(7);
    }
    EXPECT_EQ(RunCommand("sleep 0.2; exit 4"), 4);
    EXPECT_EQ(::kill(other, 0), -1);
}

TEST(RunCommand, FixedPathAndLocaleAndNothingInherited)
{
    if (::access("/proc/self/stat", F_OK) != 0)
        GTEST_SKIP() << "needs /proc";
    ::setenv("PATH", "/nowhere", 1);
    ::setenv("LC_ALL", "tlh", 1);
    ::setenv("KEPT", "yes", 1);
    ::signal(SIGPIPE, SIG_IGN);
    sigset_t mask;
    sigemptyset(&mask);
    sigaddset(&mask, SIGUSR1);
    ::sigprocmask(SIG_BLOCK, &mask, nullptr);
    const int leaky = ::open("/etc/passwd", O_RDONLY);  // not close-on-exec

    EXPECT_EQ(LinesOf("echo $PATH $LC_ALL $KEPT"), std::vector<std::string>{"/usr/sbin:/usr/bin:/sbin:/bin C yes"});
    EXPECT_EQ(LinesOf("readlink /proc/self/fd/0; test -e /proc/self/fd/" + std::to_string(leaky) + " || echo none"),
              (std::vector<std::string>{"/dev/null", "none"}));
    EXPECT_EQ(LinesOf("grep -E '^Sig(Blk|Ign)' /proc/self/status"),
              (std::vector<std::string>{"SigBlk:\t0000000000000000", "SigIgn:\t0000000000000000"}));

    ::close(leaky);
    ::sigprocmask(SIG_UNBLOCK, &mask, nullptr);
    ::signal(SIGPIPE, SIG_DFL);
}

TEST(RunCommand, ThousandRunsLeakNothing)
{
    const int before = test::OpenDescriptors();
    for (int i = 0; i < 334; ++i) {
        RunCommand("exit 1");
        StatusOf("echo x; exit 1");
        CommandOutput unread("yes");
    }
    EXPECT_EQ(test::OpenDescriptors(), before);
    EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1);
    EXPECT_EQ(errno, ECHILD);
}

TEST(CommandOutput, Lines)
{
    const std::string longer(10000, 'x');
    EXPECT_EQ(LinesOf("printf 'a\\n\\nb'"), (std::vector<std::string>{"a", "", "b"}));
    EXPECT_EQ(LinesOf("true"), std::vector<std::string>{});
    EXPECT_EQ(LinesOf("printf '%010000d\\nz\\n' 0 | tr 0 x"), (std::vector<std::string>{longer, "z"}));

    CommandOutput partly("seq 1 100000; exit 5");
    std::string line;
    EXPECT_TRUE(partly.Next(line));
    EXPECT_EQ(line, "1");
    EXPECT_EQ(partly.Status(), 5);
    EXPECT_FALSE(partly.Next(line));
    EXPECT_EQ(partly.Status(), 5);
}

// A daemon has closed its standard descriptors: the pipe must not get their numbers.
TEST(CommandOutput, WithoutStandardDescriptors)
{
    EXPECT_EQ(test::InChild([] {
                  for (int fd = 0; fd <= 2; ++fd)
                      ::close(fd);
                  CommandOutput output("echo x; cat; exit 6");
                  std::string line;
                  const bool read = output.Next(line) && line == "x" && !output.Next(line);
                  return read && output.Status() == 6 && RunCommand("exit 7") == 7 ? 0 : 1;
              }),
              0);
}

}  // namespace
