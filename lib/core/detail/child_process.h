// Starts a program in a child process.
//
// The child borrows the parent's memory until it executes the program (vfork), so that starting a program costs the same
// from a daemon with a gigabyte as from a small tool. It therefore changes nothing but its own kernel state: the lock
// streams, which are close-on-exec, go without being closed one by one. The parent is held up until the program has been
// read from its disk.
#ifndef TAVO_CORE_DETAIL_CHILD_PROCESS_H
#define TAVO_CORE_DETAIL_CHILD_PROCESS_H

#include <sys/types.h>

namespace tavo {

// What a standard descriptor of the child is when it is no descriptor of the parent's.
constexpr int kNullDevice = -1;
constexpr int kInherited = -2;  // /dev/null where the parent has closed it

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
    bool copy = false;              // a child with memory of its own (fork), which never holds up the parent
};

// The pid, or -1 with errno.
pid_t StartChild(const ChildPlan &plan) noexcept;

}  // namespace tavo

#endif
