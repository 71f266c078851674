// Collects the status of child processes.
#include "core/detail/child_status.h"

#include "core/detail/owner.h"

#include <sys/wait.h>

namespace tavo {
namespace {

constexpr int kMostLeft = 16;

constinit pid_t left_children[kMostLeft] = {};
constinit int next_left = 0;

}  // namespace

int ExitResult(int wait_status) noexcept
{
    return WIFEXITED(wait_status) ? WEXITSTATUS(wait_status) : -1;
}

int CollectChild(pid_t pid) noexcept
{
    int status = 0;
    while (::waitpid(pid, &status, 0) < 0) {
        if (errno != EINTR)
            return errno == ECHILD ? 0 : -1;
    }
    return ExitResult(status);
}

void LeaveChild(pid_t pid) noexcept
{
    left_children[next_left] = pid;
    next_left = (next_left + 1) % kMostLeft;
}

void ReapLeftChildren() noexcept
{
    KeepErrno keep;
    for (pid_t &child : left_children) {
        // In a forked child the pid is not its child: ECHILD.
        if (child > 0 && ::waitpid(child, nullptr, WNOHANG) != 0)
            child = 0;
    }
}

KeepChildStatus::KeepChildStatus() noexcept
{
    changed_ = ::sigaction(SIGCHLD, nullptr, &saved_) == 0 &&
               (saved_.sa_handler == SIG_IGN || (saved_.sa_flags & SA_NOCLDWAIT) != 0);
    if (!changed_)
        return;
    struct sigaction collecting = saved_;
    collecting.sa_flags &= ~SA_NOCLDWAIT;
    if (collecting.sa_handler == SIG_IGN)
        collecting.sa_handler = SIG_DFL;
    ::sigaction(SIGCHLD, &collecting, nullptr);
}

KeepChildStatus::~KeepChildStatus()
{
    if (!changed_)
        return;
    KeepErrno keep;
    ::sigaction(SIGCHLD, &saved_, nullptr);
    SweepZombies();
}

void SweepZombies() noexcept
{
    while (::waitpid(-1, nullptr, WNOHANG) > 0) {
    }
}

}  // namespace tavo
