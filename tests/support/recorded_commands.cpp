// Takes the place of the shell.
#include "support/recorded_commands.h"

#include <csignal>
#include <cstdlib>
#include <cstring>

#include <dlfcn.h>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace test {
namespace {

RecordedCommands *current = nullptr;

constexpr size_t kLogBytes = 1 << 20;

}  // namespace

// Shared with the child processes: each command ends in a NUL.
struct RecordedCommands::Log {
    size_t used;
    char text[kLogBytes - sizeof(size_t)];
};

RecordedCommands::RecordedCommands(Answer answer) : answer_(std::move(answer))
{
    void *const shared = ::mmap(nullptr, sizeof(Log), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    if (shared == MAP_FAILED)
        std::abort();
    log_ = static_cast<Log *>(shared);
    current = this;
}

RecordedCommands::~RecordedCommands()
{
    current = nullptr;
    ::munmap(log_, sizeof(Log));
}

std::vector<std::string> RecordedCommands::Commands() const
{
    std::vector<std::string> commands;
    for (size_t at = 0; at < log_->used; at += commands.back().size() + 1)
        commands.emplace_back(log_->text + at);
    return commands;
}

std::vector<std::string> RecordedCommands::Take()
{
    std::vector<std::string> commands = Commands();
    Clear();
    return commands;
}

void RecordedCommands::Clear()
{
    log_->used = 0;
}

int RecordedCommands::Reply(const char *command) const
{
    const CommandReply reply = answer_ ? answer_(command) : CommandReply{};
    const ssize_t written = ::write(STDOUT_FILENO, reply.output.data(), reply.output.size());
    return written == static_cast<ssize_t>(reply.output.size()) ? reply.status : 126;
}

void RecordedCommands::Run(const char *command)
{
    const size_t length = std::strlen(command) + 1;
    if (log_->used + length <= sizeof log_->text) {
        std::memcpy(log_->text + log_->used, command, length);
        log_->used += length;
    }
    // The child may share the parent's memory: it frees what it allocates before it ends, and it skips the leak check
    // that a sanitizer puts into _exit.
    const int status = Reply(command);
    if (status < 0)
        ::kill(::getpid(), -status);
    ::syscall(SYS_exit_group, status);
    __builtin_unreachable();
}

}  // namespace test

extern "C" int execve(const char *path, char *const *arguments, char *const *environment)
{
    if (test::current && std::strcmp(path, "/bin/sh") == 0 && arguments[1] && std::strcmp(arguments[1], "-c") == 0)
        test::current->Run(arguments[2]);
    using Execve = int(const char *, char *const *, char *const *);
    return reinterpret_cast<Execve *>(::dlsym(RTLD_NEXT, "execve"))(path, arguments, environment);
}
