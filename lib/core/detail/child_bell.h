// Rings when a child of this process ends, so that a caller can wait for a child and for a deadline at once.
//
// While a bell exists, children keep their status until they are collected. The SIGCHLD handler stays installed after
// the bell is gone. In a process whose children the kernel collected, the kernel collects them again then.
#ifndef TAVO_CORE_DETAIL_CHILD_BELL_H
#define TAVO_CORE_DETAIL_CHILD_BELL_H

#include <chrono>
#include <csignal>

namespace tavo {

class ChildBell {
  public:
    using Clock = std::chrono::steady_clock;

    ChildBell() noexcept;  // aborts the process when it has no free descriptor
    ~ChildBell();
    ChildBell(const ChildBell &) = delete;
    ChildBell &operator=(const ChildBell &) = delete;

    // True when some child may have ended since the last call; false when the deadline has passed.
    bool Wait(Clock::time_point deadline) noexcept;

  private:
    bool kernel_collects_;
    sigset_t mask_;
};

}  // namespace tavo

#endif
