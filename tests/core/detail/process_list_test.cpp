// The process table: one line for each running process, whatever its arguments contain.
#include "core/detail/process_list.h"

#include "support/own_child.h"
#include "support/test.h"

#include <climits>

#include <sys/prctl.h>

namespace {

std::string CommandOf(pid_t pid)
{
    std::string command = "(none)";
    for (const tavo::Process &process : tavo::ListProcesses())
        command = process.pid == pid ? process.command : command;
    return command;
}

TEST(ProcessList, MakesOneLineOfEachProcess)
{
    SKIP_WITHOUT_PROC();
    test::OwnChild shell([] { ::execl("/bin/sh", "sh", "-c", "sleep 60; :", "a\nb", "", "", nullptr); });
    EXPECT_TRUE(test::Eventually([&] { return CommandOf(shell.Pid()) == "sh -c sleep 60; : a?b"; }))
        << CommandOf(shell.Pid());
    const tavo::Process process = {shell.Pid(), CommandOf(shell.Pid())};
    EXPECT_EQ(tavo::ProcessLine(process), std::to_string(shell.Pid()) + " sh -c sleep 60; : a?b");
    EXPECT_THAT(tavo::FindProcesses(tavo::ProcessLine(process)), testing::ElementsAre(shell.Pid()));
    EXPECT_THAT(tavo::FindProcesses("a?b "), testing::IsEmpty()) << "without what ends the last argument";

    // Like a process of the kernel, which has a name and no command.
    test::OwnChild nameless([] {
        std::ifstream stat("/proc/self/stat");
        std::string text((std::istreambuf_iterator<char>(stat)), {});
        std::istringstream fields(text.substr(text.rfind(')')));
        std::string field;
        for (int i = 2; i <= 48 && fields >> field; ++i) {
        }
        ::prctl(PR_SET_NAME, "a) b");
        if (::prctl(PR_SET_MM, PR_SET_MM_ARG_END, std::stoul(field), 0, 0) == 0)  // not in every emulator
            ::pause();
    });
    test::OwnChild ended([] {});
    EXPECT_TRUE(test::Eventually([&] { return tavo::IsZombie(ended.Pid()); }));
    EXPECT_EQ(CommandOf(ended.Pid()), "(none)");
    EXPECT_FALSE(tavo::IsZombie(shell.Pid()) || tavo::IsZombie(INT_MAX));
    std::string command;
    const auto is_nameless = [&] {
        command = CommandOf(nameless.Pid());
        return command == "[a) b]" || command == "(none)";
    };
    EXPECT_TRUE(test::Eventually(is_nameless)) << command;
}

}  // namespace
