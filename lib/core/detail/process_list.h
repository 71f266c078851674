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

// Every process, the caller's own too, by ascending pid. Empty when there is no /proc. Throws bad_alloc.
std::vector<Process> ListProcesses();

// The line that a process table shows for it: "PID ARGUMENTS".
std::string ProcessLine(const Process &process);

// The pids of the processes whose line holds the text, which is plain text: "[nfsd]" finds just those threads. The
// caller's own process counts, if it matches. Throws bad_alloc.
std::vector<pid_t> FindProcesses(std::string_view text);

}  // namespace tavo

#endif
