// The system's own tools.
#include "storage/system_tool.h"

#include "frame/failure.h"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <spawn.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tavoctl {

std::string ToolResult::Reason() const
{
    const std::size_t end = output.find_last_not_of(" \t\r\n");
    if (end == output.npos)
        return "it ended with status " + std::to_string(status);
    const std::size_t start = output.find_last_of("\r\n", end) + 1;  // npos is the largest number
    return output.substr(start, end + 1 - start);
}

ToolResult TryTool(const std::vector<std::string> &words)
{
    // Not a pipe: what mdadm leaves running in the background would keep it open.
    const int output = ::memfd_create("output", MFD_CLOEXEC);
    if (output < 0)
        throw SystemFailure("run " + words[0], errno);
    std::vector<char *> arguments;
    for (const std::string &word : words)
        arguments.push_back(const_cast<char *>(word.c_str()));
    arguments.push_back(nullptr);
    char path[] = "PATH=/usr/sbin:/usr/bin:/sbin:/bin";
    char language[] = "LC_ALL=C";
    char *environment[] = {path, language, nullptr};
    posix_spawn_file_actions_t streams;
    ::posix_spawn_file_actions_init(&streams);
    ::posix_spawn_file_actions_addopen(&streams, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    ::posix_spawn_file_actions_adddup2(&streams, output, STDOUT_FILENO);
    ::posix_spawn_file_actions_adddup2(&streams, output, STDERR_FILENO);
    pid_t pid = 0;
    const int error = ::posix_spawn(&pid, words[0].c_str(), &streams, nullptr, arguments.data(), environment);
    ::posix_spawn_file_actions_destroy(&streams);
    ToolResult result = {};
    int status = 0;
    while (error == 0 && ::waitpid(pid, &status, 0) < 0 && errno == EINTR)
        ;
    char bytes[4096];
    for (ssize_t count; (count = ::pread(output, bytes, sizeof bytes, static_cast<off_t>(result.output.size()))) > 0;)
        result.output.append(bytes, static_cast<std::size_t>(count));
    ::close(output);
    if (error != 0)
        throw Failure{.attempted = "run " + words[0], .reason = std::strerror(error)};
    result.status = WIFEXITED(status) ? WEXITSTATUS(status) : exit_by_signal + WTERMSIG(status);
    return result;
}

std::string RunTool(const std::vector<std::string> &words, const std::string &attempted)
{
    ToolResult result = TryTool(words);
    FailIf(result.status != 0, attempted, words[0] + ": " + result.Reason());
    return std::move(result.output);
}

}  // namespace tavoctl
