// Runs the commands that change disks, partitions, arrays and volumes.
#ifndef TAVO_STORAGE_DETAIL_PARTITION_COMMAND_H
#define TAVO_STORAGE_DETAIL_PARTITION_COMMAND_H

#include "core/detail/run_command.h"
#include "core/detail/shell_command.h"

#include <string>

namespace tavo {

struct CommandResult {
    std::string command;
    int status;            // the exit status; -1 when it was not run or was killed
    ToolWords words = {};  // logged when the result goes
};

inline CommandResult RunComposed(const std::string &command)
{
    CommandResult result = {command, -1};
    result.status = RunCommand(command, result.words);
    return result;
}

template <class... Args>
CommandResult RunDiskCommand(FormatFor<Args...> format, const Args &...args)
{
    const std::optional<std::string> command = ShellCommand(format, args...);
    if (!command)
        return {format.Text(), -1};
    return RunComposed(*command);
}

}  // namespace tavo

#endif
