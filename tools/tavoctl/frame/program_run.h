// A program of the caller's, run as a shell would run it.
#ifndef TAVOCTL_PROGRAM_RUN_H
#define TAVOCTL_PROGRAM_RUN_H

#include <string>
#include <vector>

namespace tavoctl {

// Looks the program up in PATH, runs it with this program's standard input, output and error, and waits for it.
// Signals that ask this program to end go to it. Returns its exit status as a shell gives it.
int RunInForeground(const std::vector<std::string> &words);

// The program's path: a name without "/" is looked up in PATH. Throws a Failure when there is no such program.
std::string FindProgram(const std::string &name);

}  // namespace tavoctl

#endif
