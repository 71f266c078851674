// Runs a program detached from the caller, for a limited time.
#include "tavo_proc.h"

#include "core/detail/argument_list.h"
#include "core/detail/child_bell.h"
#include "core/detail/child_process.h"
#include "core/detail/child_status.h"
#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "core/detail/path_only_environment.h"

#include <cerrno>
#include <optional>

#include <sys/wait.h>

namespace {

using std::chrono::seconds;
using tavo::ChildBell;

// How long a killed program may take to die. A later call collects one that hangs in the kernel (a dead disk).
constexpr seconds kPatience{1};

// The result of the child when it has ended.
std::optional<int> TryCollect(pid_t pid)
{
    int status = 0;
    for (;;) {
        const pid_t ended = ::waitpid(pid, &status, WNOHANG);
        if (ended == pid)
            return tavo::ExitResult(status);
        if (ended == 0)
            return std::nullopt;
        if (errno != EINTR)
            return errno == ECHILD ? 0 : -1;
    }
}

std::optional<int> CollectBefore(ChildBell::Clock::time_point deadline, ChildBell &bell, pid_t pid)
{
    for (;;) {
        if (const std::optional<int> result = TryCollect(pid))
            return result;
        if (!bell.Wait(deadline))
            return TryCollect(pid);
    }
}

// The child leads a process group, so the programs that it has started die with it.
void Kill(pid_t pid)
{
    for (const int signal : {SIGTERM, SIGKILL}) {
        ::kill(pid, signal);
        ::kill(-pid, signal);
    }
}

}  // namespace

extern "C" int TLIBTimedExec(int cSeconds, const char *szProgram, ...)
{
    if (cSeconds < 1) {
        LogError("%s:%d Invaild Argument (%s)=[%d]\n", "cSeconds", cSeconds);
        return Fail(ERR_BAD_PARAMETERS);
    }
    if (!szProgram || !*szProgram) {
        LogError("%s:%d Invaild Argument (%s)=[%d]\n", "szProgram", 0);
        return Fail(ERR_BAD_PARAMETERS);
    }
    va_list list;
    va_start(list, szProgram);
    const tavo::ArgumentList<30> arguments(szProgram, list);
    va_end(list);
    const tavo::PathOnlyEnvironment environment;

    const ChildBell::Clock::time_point deadline = ChildBell::Clock::now() + seconds(cSeconds);
    ChildBell bell;
    const pid_t pid = tavo::StartChild({.program = szProgram,
                                        .arguments = arguments.Vector(),
                                        .environment = environment.Variables(),
                                        .new_session = true,
                                        .root_directory = true,
                                        .default_signals = true,
                                        .copy = true});
    if (pid < 0)
        return Fail(ERR_OP_FAILURE);
    if (const std::optional<int> result = CollectBefore(deadline, bell, pid))
        return *result == -1 ? Fail(ERR_OP_FAILURE) : *result;
    Kill(pid);
    if (!CollectBefore(ChildBell::Clock::now() + kPatience, bell, pid))
        tavo::LeaveChild(pid);
    return Fail(ERR_TIMER_EXPIRED);
}
