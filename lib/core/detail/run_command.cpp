// Runs a composed command line through the shell and returns its exit status.
#include "core/detail/run_command.h"

#include "core/detail/child_process.h"
#include "core/detail/child_status.h"

#include <string_view>
#include <vector>

#include <unistd.h>

namespace tavo {
namespace {

std::vector<char *> CommandEnvironment(char *path, char *locale)
{
    std::vector<char *> variables;
    for (char **entry = environ; entry && *entry; ++entry) {
        const std::string_view variable = *entry;
        if (!variable.starts_with("PATH=") && !variable.starts_with("LC_ALL="))
            variables.push_back(*entry);
    }
    variables.insert(variables.end(), {path, locale, nullptr});
    return variables;
}

int Run(const std::string &command, int output, int error)
{
    const KeepChildStatus keep;
    const pid_t pid = StartCommand(command, output, error);
    return pid < 0 ? -1 : CollectChild(pid);
}

}  // namespace

pid_t StartCommand(const std::string &command, int output, int error)
{
    char path[] = "PATH=/usr/sbin:/usr/bin:/sbin:/bin";
    char locale[] = "LC_ALL=C";
    char shell[] = "sh";
    char option[] = "-c";
    std::string text = command;
    char *const arguments[] = {shell, option, text.data(), nullptr};
    const std::vector<char *> environment = CommandEnvironment(path, locale);
    return StartChild({.program = "/bin/sh",
                       .arguments = arguments,
                       .environment = environment.data(),
                       .standard = {kNullDevice, output, error},
                       .close_others = true,
                       .default_signals = true,
                       .abort_on_failure = true});
}

int RunCommand(const std::string &command)
{
    return Run(command, kInherited, kInherited);
}

int RunCommandQuietly(const std::string &command)
{
    return Run(command, kNullDevice, kNullDevice);
}

int RunCommand(const std::string &command, const ToolWords &words)
{
    return Run(command, kNullDevice, words.Descriptor());
}

}  // namespace tavo
