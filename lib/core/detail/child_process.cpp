// Starts a program in a child process.
#include "core/detail/child_process.h"

#include "tavo_lock.h"

#include "core/detail/child_status.h"
#include "core/detail/owner.h"

#include <algorithm>
#include <climits>
#include <csignal>
#include <cstdio>

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/syscall.h>

namespace tavo {
namespace {

// From here to RunChild the code runs in the child but in the parent's memory: it makes system calls and nothing else.

[[noreturn]] void GiveUp(const ChildPlan &plan)
{
    if (plan.abort_on_failure) {
        const struct rlimit no_core = {0, 0};
        ::setrlimit(RLIMIT_CORE, &no_core);
        sigset_t abort_signal;
        sigemptyset(&abort_signal);
        sigaddset(&abort_signal, SIGABRT);
        struct sigaction by_default = {};
        by_default.sa_handler = SIG_DFL;
        ::sigaction(SIGABRT, &by_default, nullptr);
        ::sigprocmask(SIG_UNBLOCK, &abort_signal, nullptr);
        ::kill(::getpid(), SIGABRT);
    }
    ::_exit(255);
}

bool SetStandardDescriptors(const ChildPlan &plan)
{
    int null_device = -1;
    for (int fd = 0; fd <= 2; ++fd) {
        int source = plan.standard[fd];
        if (source == kInherited && ::fcntl(fd, F_GETFD) >= 0)
            continue;
        // The first file that the program opens must not become its output.
        if (source == kInherited)
            source = kNullDevice;
        if (source == kNullDevice) {
            if (null_device < 0 && (null_device = ::open("/dev/null", O_RDWR | O_NOCTTY)) < 0)
                return false;
            source = null_device;
        }
        if (source != fd && ::dup2(source, fd) < 0)
            return false;
    }
    if (null_device > 2)
        ::close(null_device);
    return true;
}

void CloseOtherDescriptors()
{
#ifdef SYS_close_range
    if (::syscall(SYS_close_range, 3u, UINT_MAX, 0u) == 0)
        return;
#endif
    // For kernels and emulators without close_range. No process uses descriptors beyond this number, even where its
    // limit is higher.
    constexpr rlim_t highest = 65536;
    struct rlimit limit = {highest, highest};
    ::getrlimit(RLIMIT_NOFILE, &limit);
    const int end = static_cast<int>(std::min(limit.rlim_cur, highest));
    for (int fd = 3; fd < end; ++fd)
        ::close(fd);
}

// Resets the parent's handlers before a signal can reach the child and run one of them in the parent's memory.
void SetSignals(const ChildPlan &plan, const sigset_t &parent_mask)
{
    struct sigaction by_default = {};
    by_default.sa_handler = SIG_DFL;
    for (int signal = 1; signal < NSIG; ++signal) {
        struct sigaction action;
        if (plan.default_signals || (::sigaction(signal, nullptr, &action) == 0 && action.sa_handler != SIG_IGN &&
                                     action.sa_handler != SIG_DFL))
            ::sigaction(signal, &by_default, nullptr);
    }
    sigset_t mask = parent_mask;
    if (plan.default_signals)
        sigemptyset(&mask);
    ::sigprocmask(SIG_SETMASK, &mask, nullptr);
}

// A copy that waits for its program must not keep locks that its parent loses.
void CloseLocks()
{
    for (const TLIBLOCKFILE *entry = rgslckList; entry->fLockBit != 0; ++entry) {
        if (entry->pfLock)
            ::close(::fileno(entry->pfLock));
    }
}

[[noreturn]] void RunChild(const ChildPlan &plan, const sigset_t &parent_mask)
{
    if (plan.copy)
        CloseLocks();
    if (!SetStandardDescriptors(plan))
        GiveUp(plan);
    if (plan.new_session)
        ::setsid();
    if (plan.root_directory && ::chdir("/") != 0)
        GiveUp(plan);
    if (plan.close_others)
        CloseOtherDescriptors();
    SetSignals(plan, parent_mask);
    if (plan.program && plan.arguments)
        ::execve(plan.program, plan.arguments, plan.environment);
    GiveUp(plan);
}

[[gnu::noinline]] pid_t Fork(const ChildPlan &plan, const sigset_t &parent_mask)
{
    const pid_t pid = plan.copy ? ::fork() : ::vfork();
    if (pid == 0)
        RunChild(plan, parent_mask);
    return pid;
}

}  // namespace

pid_t StartChild(const ChildPlan &plan) noexcept
{
    ReapLeftChildren();
    sigset_t all, parent_mask;
    sigfillset(&all);
    ::pthread_sigmask(SIG_BLOCK, &all, &parent_mask);
    const int before = errno;
    const pid_t pid = Fork(plan, parent_mask);
    const int after = pid < 0 ? errno : before;  // the child's own failures are in errno, too
    ::pthread_sigmask(SIG_SETMASK, &parent_mask, nullptr);
    errno = after;
    return pid;
}

}  // namespace tavo
