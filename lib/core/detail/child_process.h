// Starts a program in a child process.
//
// The child borrows the parent's memory until it executes the program (vfork), so that starting a program costs a
// daemon with a gigabyte no more than a small tool. The child therefore changes only its own kernel state. The lock
// streams are close-on-exec and need no closing. The parent waits until the program has been read from its disk.
#ifndef TAVO_CORE_DETAIL_CHILD_PROCESS_H
#define TAVO_CORE_DETAIL_CHILD_PROCESS_H

#include <sys/types.h>

namespace tavo {

// Values of a standard descriptor of the child that are not descriptors of the parent.
constexpr int kNullDevice = -1;
constexpr int kInherited = -2;  // /dev/null where the parent has closed it

struct ChildPlan {
    const char *program;
    char *const *arguments;
    char *const *environment;
    int standard[3] = {kNullDevice, kNullDevice, kNullDevice};  // descriptors of the parent; must be above 2
    bool new_session = false;
    bool root_directory = false;    // start in "/"
    bool close_others = false;      // no descriptor above 2
    bool default_signals = false;   // none ignored, none blocked; otherwise inherited from the parent
    bool abort_on_failure = false;  // dies by SIGABRT when the program cannot be executed; otherwise exits with 255
    bool copy = false;              // a child with its own memory (fork), which never delays the parent
};

// The pid, or -1 with errno.
pid_t StartChild(const ChildPlan &plan) noexcept;

}  // namespace tavo

#endif
