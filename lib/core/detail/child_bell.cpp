// Rings when a child of this process ends.
#include "core/detail/child_bell.h"

#include "core/detail/child_status.h"
#include "core/detail/owner.h"

#include <algorithm>
#include <climits>
#include <cstdlib>

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>

namespace tavo {
namespace {

// One pipe per process. Programs that become daemons close all descriptors and may reuse these numbers for other files,
// so the pipe is checked before each use. The handler does nothing while no bell exists.
struct BellPipe {
    int ends[2];
    dev_t device;
    ino_t inode;
    pid_t owner;
};

constinit BellPipe bell = {{-1, -1}, 0, 0, 0};
volatile sig_atomic_t ringing = 0;

bool IsStillOpen()
{
    struct stat st[2];
    for (int end = 0; end < 2; ++end) {
        if (bell.ends[end] < 0 || ::fstat(bell.ends[end], &st[end]) != 0 || st[end].st_dev != bell.device ||
            st[end].st_ino != bell.inode)
            return false;
    }
    return true;
}

void OpenPipe()
{
    if (IsStillOpen()) {
        if (bell.owner == ::getpid())
            return;
        // After a fork the pipe is shared, and this process would take the parent's rings from it.
        ::close(bell.ends[0]);
        ::close(bell.ends[1]);
    }
    struct stat st;
    if (::pipe2(bell.ends, O_CLOEXEC | O_NONBLOCK) != 0 || ::fstat(bell.ends[0], &st) != 0)
        std::abort();
    bell.device = st.st_dev;
    bell.inode = st.st_ino;
    bell.owner = ::getpid();
}

void Drain()
{
    char rings[4096];
    while (::read(bell.ends[0], rings, sizeof rings) > 0) {
    }
}

extern "C" void TavoRingBell(int)
{
    if (!ringing)
        return;
    const int before = errno;
    const ssize_t written = ::write(bell.ends[1], "", 1);  // a full pipe rings, too
    static_cast<void>(written);
    errno = before;
}

void InstallHandler(int more_flags)
{
    struct sigaction action = {};
    action.sa_handler = TavoRingBell;
    action.sa_flags = SA_RESTART | SA_NOCLDSTOP | more_flags;
    ::sigaction(SIGCHLD, &action, nullptr);
}

}  // namespace

ChildBell::ChildBell() noexcept
{
    OpenPipe();
    Drain();
    ringing = 1;
    struct sigaction before = {};
    ::sigaction(SIGCHLD, nullptr, &before);
    kernel_collects_ = before.sa_handler == SIG_IGN || (before.sa_flags & SA_NOCLDWAIT) != 0;
    InstallHandler(0);
    sigset_t child;
    sigemptyset(&child);
    sigaddset(&child, SIGCHLD);
    ::pthread_sigmask(SIG_UNBLOCK, &child, &mask_);
}

ChildBell::~ChildBell()
{
    KeepErrno keep;
    ::pthread_sigmask(SIG_SETMASK, &mask_, nullptr);
    ringing = 0;
    if (kernel_collects_) {
        InstallHandler(SA_NOCLDWAIT);
        SweepZombies();
    }
}

bool ChildBell::Wait(Clock::time_point deadline) noexcept
{
    for (;;) {
        const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - Clock::now()).count();
        if (left <= 0)
            return false;
        struct pollfd end = {bell.ends[0], POLLIN, 0};
        if (::poll(&end, 1, static_cast<int>(std::min<long long>(left, INT_MAX))) > 0) {
            Drain();
            return true;
        }
    }
}

}  // namespace tavo
