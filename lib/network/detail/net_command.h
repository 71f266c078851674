// The commands that change the network, run with arguments that have been validated.
#ifndef TAVO_NETWORK_DETAIL_NET_COMMAND_H
#define TAVO_NETWORK_DETAIL_NET_COMMAND_H

#include "core/detail/run_command.h"
#include "core/detail/shell_command.h"

namespace tavo {

// Runs a composed command, and records it for the process that has to complete the change if this one dies meanwhile.
// Returns as RunCommand or, quietly, as RunCommandQuietly.
int RunNetText(const std::string &command, bool quietly = false);

// The exit status; -1 when the command could not be composed or run, or was killed.
template <class... Args>
int RunNetCommand(FormatFor<Args...> format, const Args &...args)
{
    const auto command = ShellCommand(format, args...);
    return command ? RunNetText(*command) : -1;
}

}  // namespace tavo

#endif
