// Finds the holder of a lock that could not be taken, for the log.
#ifndef TAVO_CORE_DETAIL_LOCK_HOLDER_H
#define TAVO_CORE_DETAIL_LOCK_HOLDER_H

#include <sys/types.h>

namespace tavo {

struct LockHolder {
    pid_t pid = 0;        // 0: unknown, such as a process that root of another container runs
    char name[64] = "?";  // the kernel's short name of the program
};

// Returns the first holder of an flock on the file, as /proc/locks lists it. The process that took the lock may have
// ended since and left it to a child.
LockHolder FindLockHolder(const char *path) noexcept;

}  // namespace tavo

#endif
