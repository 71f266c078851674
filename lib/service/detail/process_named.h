// Finds a daemon among the running processes by its name.
#ifndef TAVO_SERVICE_DETAIL_PROCESS_NAMED_H
#define TAVO_SERVICE_DETAIL_PROCESS_NAMED_H

#include <string_view>

namespace tavo {

// True when a process of that name runs: a program of that name in any folder, a script of that name, or a kernel
// thread, "[nfsd]" or "nfsd". Programs that merely mention the name among their arguments do not count.
bool IsProcessNamed(std::string_view name);

// Returns the name in one line of the process table; declared here for the tests.
bool CommandHasName(std::string_view command, std::string_view name);

}  // namespace tavo

#endif
