// Reads the process table from /proc.
#ifndef TAVO_CORE_DETAIL_PROCESS_LIST_H
#define TAVO_CORE_DETAIL_PROCESS_LIST_H

#include <string>
#include <string_view>
#include <vector>

#include <sys/types.h>

namespace tavo {

struct Process {
    pid_t pid;
    std::string command;  // the arguments joined by blanks; "[NAME]" of a process without any (a kernel thread)
};

// Lists the running processes, the caller's own too, by ascending pid, without zombies. Empty when there is no /proc.
// Throws bad_alloc.
std::vector<Process> ListProcesses();

// Returns whether the process is a zombie. Throws bad_alloc.
bool IsZombie(pid_t pid);

// Returns the line of the process in a process table: "PID ARGUMENTS".
std::string ProcessLine(const Process &process);

// Lists the pids of the processes whose line contains the text literally: "[nfsd]" finds just those threads. The
// caller's own process counts if it matches. Throws bad_alloc.
std::vector<pid_t> FindProcesses(std::string_view text);

}  // namespace tavo

#endif
