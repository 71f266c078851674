// Checks whether a process exists.
#include "tavo_proc.h"

#include <cerrno>
#include <csignal>

extern "C" int BlTLIBProcAlive(pid_t pid)
{
    // 0 and negative numbers would ask about the caller's own group, other groups, or every process.
    return pid > 0 && (::kill(pid, 0) == 0 || errno == EPERM);
}
