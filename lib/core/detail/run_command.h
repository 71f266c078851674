// Runs a composed command line through the shell and returns its exit status.
//
// Whatever the caller's environment, the command runs with PATH=/usr/sbin:/usr/bin:/sbin:/bin and LC_ALL=C, with
// /dev/null as standard input, the caller's standard output and error, no other descriptor, and default signals.
#ifndef TAVO_CORE_DETAIL_RUN_COMMAND_H
#define TAVO_CORE_DETAIL_RUN_COMMAND_H

#include "core/detail/tool_words.h"

#include <string>

#include <sys/types.h>

namespace tavo {

// Returns the exit status, 0 to 255; -1 when the command could not be run or was killed by a signal. Throws bad_alloc.
int RunCommand(const std::string &command);

// The same with /dev/null as standard output and error: for commands that complain where nothing has failed.
int RunCommandQuietly(const std::string &command);

// The same with /dev/null as standard output and `words` as standard error.
int RunCommand(const std::string &command, const ToolWords &words);

// Starts the command; `output` and `error` are descriptors above 2, kNullDevice or kInherited. -1 with errno.
pid_t StartCommand(const std::string &command, int output, int error);

}  // namespace tavo

#endif
