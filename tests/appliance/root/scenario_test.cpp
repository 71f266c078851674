// The scripted tools as test programs use them.
#include "support/scenario.h"

#include <gmock/gmock.h>

#include <csignal>
#include <cstdlib>
#include <string>
#include <vector>

#include <sys/wait.h>
#include <unistd.h>

namespace test {
namespace {

using testing::ElementsAre;

struct Result {
    int status;
    std::string output;
};

Result RunTool(const std::vector<std::string> &words)
{
    int pipe[2];
    EXPECT_EQ(::pipe(pipe), 0);
    const pid_t child = ::fork();
    if (child == 0) {
        std::vector<char *> argv;
        for (const std::string &word : words)
            argv.push_back(const_cast<char *>(word.c_str()));
        argv.push_back(nullptr);
        ::dup2(pipe[1], 1);
        ::execv(words[0].c_str(), argv.data());
        ::_exit(127);
    }
    ::close(pipe[1]);
    Result result = {};
    char buffer[4096];
    for (ssize_t got; (got = ::read(pipe[0], buffer, sizeof buffer)) > 0;)
        result.output.append(buffer, static_cast<size_t>(got));
    ::close(pipe[0]);
    ::waitpid(child, &result.status, 0);
    return result;
}

TEST(Scenario, PlaysTheScriptForAnyArguments)
{
    const std::vector<std::string> hostile = {
        "/sbin/mdadm", "", "a b", "$(reboot)", "new\nline\n", "'\"`\\", "\x01\x7f\xff", "0001 x", "...", "-E", "~"};
    Scenario scenario;
    scenario.Expect(hostile).Prints(std::string("whole\0text", 10)).Exits(3);
    scenario.Expect({"/sbin/vgs", "-o"}).Times(2).Prints("x\n");
    const Result mdadm = RunTool(hostile);
    EXPECT_EQ(WEXITSTATUS(mdadm.status), 3);
    EXPECT_EQ(mdadm.output, std::string("whole\0text", 10));
    RunTool({"/sbin/vgs", "-o"});
    EXPECT_EQ(RunTool({"/sbin/vgs", "-o"}).output, "x\n");
    EXPECT_THAT(Scenario::Calls(),
                ElementsAre(testing::StartsWith("/sbin/mdadm $'' $'a b' "), "/sbin/vgs -o", "/sbin/vgs -o"));
}

TEST(Scenario, DoesNotTakeOneVectorForAnother)
{
    const struct {
        std::vector<std::string> expected, called;
    } rows[] = {
        {{"/sbin/pvs", "a", "b"}, {"/sbin/pvs", "a b"}},
        {{"/sbin/pvs", "a"}, {"/sbin/pvs", "a", ""}},
        {{"/sbin/pvs", "a\nb"}, {"/sbin/pvs", "a\\nb"}},
        {{"/sbin/pvs", "a"}, {"/bin/../sbin/pvs", "a"}},
        {{"/sbin/pvs"}, {"/sbin/pvs", "x"}},
    };
    for (const auto &row : rows) {
        Scenario scenario;
        scenario.Expect(row.expected);
        EXPECT_EQ(WEXITSTATUS(RunTool(row.called).status), 97);
        EXPECT_THAT(scenario.Finish(),
                    testing::AllOf(testing::HasSubstr("not expected: "), testing::HasSubstr("not called: ")));
    }
}

TEST(Scenario, KeepsTheOrderByDefault)
{
    for (const bool any_order : {false, true}) {
        Scenario scenario;
        scenario.Expect({"/sbin/lvm", "1"});
        scenario.Expect({"/sbin/lvm", "2"});
        scenario.ExpectAny("/sbin/route").AnyTimes();
        if (any_order)
            scenario.InAnyOrder();
        RunTool({"/sbin/route"});
        RunTool({"/sbin/lvm", "2"});
        RunTool({"/sbin/route", "add"});
        RunTool({"/sbin/lvm", "1"});
        EXPECT_EQ(scenario.Finish() == "", any_order);
    }
}

TEST(Scenario, ToolsHaveEffectsAndDieAsScripted)
{
    Scenario scenario;
    scenario.Expect({"/sbin/dhcpcd", "-n", "eth0"}).Runs("#!/bin/sh\necho \"$2\" >/tmp/lease\n").DiesOf(SIGKILL);
    const Result result = RunTool({"/sbin/dhcpcd", "-n", "eth0"});
    EXPECT_TRUE(WIFSIGNALED(result.status) && WTERMSIG(result.status) == SIGKILL);
    EXPECT_EQ(WEXITSTATUS(std::system("grep -qx eth0 /tmp/lease")), 0);
}

}  // namespace
}  // namespace test
