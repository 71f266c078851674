// Running processes, as the process table has them.
#ifndef TAVOCTL_PROCESSES_H
#define TAVOCTL_PROCESSES_H

#include <string>
#include <vector>

#include <sys/types.h>

namespace tavoctl {

// Every process whose line in the process table matches a regular expression, also when there are more than were made
// room for. Throws a Failure.
std::vector<pid_t> MatchingProcesses(const std::string &pattern);

// The command line; "[NAME]" for a process without one, such as a kernel thread. Empty when it has ended.
std::string CommandLine(pid_t pid);

// The process that runs a program, a script or a kernel thread of that name, the first one of several; 0 when none does.
pid_t ProcessOf(const std::string &name);

// When a process was started, "2026-11-21 17:30:05+01:00"; empty when it has ended.
std::string StartOf(pid_t pid);

}  // namespace tavoctl

#endif
