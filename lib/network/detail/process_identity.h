// A process that is still the same one, although its number may be used again.
#ifndef TAVO_NETWORK_DETAIL_PROCESS_IDENTITY_H
#define TAVO_NETWORK_DETAIL_PROCESS_IDENTITY_H

#include <string>
#include <string_view>

#include <sys/types.h>

namespace tavo {

// When a process began, in ticks since the system did. Empty for a process that is not there.
std::string BeginningOf(pid_t pid);

// Returns whether the caller is a descendant of that process.
bool IsAncestor(pid_t pid);

// Kills it and waits for its end, unless it is another process by now.
void EndProcess(pid_t pid, std::string_view beginning);

// 0 for a text that is not a number.
pid_t ToPid(std::string_view text);

}  // namespace tavo

#endif
