// Tells whether a process is there.
#include "tavo_proc.h"

#include <cerrno>
#include <csignal>

extern "C" int BlTLIBProcAlive(pid_t pid)
{
    // 0 and negative numbers would ask about the caller's own group, other groups, or everybody.
    return pid > 0 && (::kill(pid, 0) == 0 || errno == EPERM);
}
