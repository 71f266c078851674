// Starts a program in a child process and collects its status.
//
// The child borrows the parent's memory until it executes the program (vfork), so that starting a program costs the same
// from a daemon with a gigabyte as from a small tool. It therefore changes nothing but its own kernel state: the lock
// streams, which are close-on-exec, go without being closed one by one.
#ifndef TAVO_CORE_DETAIL_CHILD_PROCESS_H
#define TAVO_CORE_DETAIL_CHILD_PROCESS_H

#include <csignal>

#include <sys/types.h>

namespace tavo {

// What a standard descriptor of the child is when it is no descriptor of the parent's.
constexpr int kNullDevice = -1;
constexpr int kInherited = -2;

struct ChildPlan {
    const char *program;
    char *const *arguments;
    char *const *environment;
    int standard[3] = {kNullDevice, kNullDevice, kNullDevice};  // descriptors of the parent's are above 2
    bool new_session = false;
    bool root_directory = false;    // start in "/"
    bool close_others = false;      // no descriptor above 2
    bool default_signals = false;   // none ignored, none blocked; else what the parent ignores and blocks
    bool abort_on_failure = false;  // dies by SIGABRT when the program cannot be executed, else exits with 255
};

// The pid, or -1 with errno.
pid_t StartChild(const ChildPlan &plan) noexcept;

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

// Collects what has ended of the children that a process which ignores SIGCHLD does not want to hear of.
void SweepZombies() noexcept;

}  // namespace tavo

#endif
