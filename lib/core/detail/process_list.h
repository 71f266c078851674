// The process table as /proc shows it.
#ifndef TAVO_CORE_DETAIL_PROCESS_LIST_H
#define TAVO_CORE_DETAIL_PROCESS_LIST_H

#include <string>
#include <string_view>
#include <vector>

#include <sys/types.h>

namespace tavo {

struct Process {
    pid_t pid;
    std::string command;  // the arguments joined by blanks, or "[NAME]" of a process without any (a kernel thread)
};

// Every process that runs, the caller's own too, by ascending pid; those that have ended and wait for their parent are left
// out. Empty when there is no /proc. Throws bad_alloc.
std::vector<Process> ListProcesses();

// Whether the process has ended and only waits for its parent to ask for its status. Throws bad_alloc.
bool IsZombie(pid_t pid);

// The line that a process table shows for it: "PID ARGUMENTS".
std::string ProcessLine(const Process &process);

// The pids of the processes whose line holds the text, which is plain text: "[nfsd]" finds just those threads. The
// caller's own process counts, if it matches. Throws bad_alloc.
std::vector<pid_t> FindProcesses(std::string_view text);

}  // namespace tavo

#endif
