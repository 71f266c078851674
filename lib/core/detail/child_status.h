// What became of child processes, whatever the process has set for SIGCHLD.
#ifndef TAVO_CORE_DETAIL_CHILD_STATUS_H
#define TAVO_CORE_DETAIL_CHILD_STATUS_H

#include <csignal>

#include <sys/types.h>

namespace tavo {

// The result of a wait status: the exit code, -1 for a death by signal.
int ExitResult(int wait_status) noexcept;

// Waits for the child: its result, 0 when somebody else has collected it, -1 when waiting failed.
int CollectChild(pid_t pid) noexcept;

// For as long as it lives, children keep their status until they are collected, whatever the process has set for
// SIGCHLD. A process that ignores SIGCHLD finds no zombie of its other children afterwards.
class KeepChildStatus {
  public:
    KeepChildStatus() noexcept;
    ~KeepChildStatus();
    KeepChildStatus(const KeepChildStatus &) = delete;
    KeepChildStatus &operator=(const KeepChildStatus &) = delete;

  private:
    struct sigaction saved_;
    bool changed_;
};

// Remembers a child that has been killed and does not die, because it waits in the kernel for a disk. A later call that
// starts a program collects it, so that it stays no zombie for ever. Of many such children the latest are remembered.
void LeaveChild(pid_t pid) noexcept;
void ReapLeftChildren() noexcept;

// Collects what has ended of the children that a process which ignores SIGCHLD does not want to hear of.
void SweepZombies() noexcept;

}  // namespace tavo

#endif
