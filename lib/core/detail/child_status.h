// Collects the status of child processes, whatever the process has set for SIGCHLD.
#ifndef TAVO_CORE_DETAIL_CHILD_STATUS_H
#define TAVO_CORE_DETAIL_CHILD_STATUS_H

#include <csignal>

#include <sys/types.h>

namespace tavo {

// Converts a wait status: the exit code, -1 for a death by signal.
int ExitResult(int wait_status) noexcept;

// Waits for the child. Returns its result, 0 when another part of the process has collected it, -1 when waiting failed.
int CollectChild(pid_t pid) noexcept;

// While this object exists, children keep their status until they are collected, whatever the process has set for
// SIGCHLD. A process that ignores SIGCHLD finds no zombies of its other children afterwards.
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

// Remembers a killed child that does not die because it waits in the kernel for a disk. A later call that starts a
// program collects it, so that it does not remain a zombie. Only the latest such children are remembered.
void LeaveChild(pid_t pid) noexcept;
void ReapLeftChildren() noexcept;

// Collects ended children of a process that ignores SIGCHLD.
void SweepZombies() noexcept;

}  // namespace tavo

#endif
