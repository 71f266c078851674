// The commands that change the network.
#include "network/detail/net_command.h"

#include "core/detail/child_process.h"
#include "core/detail/child_status.h"
#include "network/detail/checkpoint.h"

namespace tavo {

int RunNetText(const std::string &command)
{
    const KeepChildStatus keep;
    Checkpoint::NoteCommand(0, command);
    const pid_t pid = StartCommand(command, kInherited, kInherited);
    if (pid < 0)
        return -1;
    Checkpoint::NoteCommand(pid, command);
    return CollectChild(pid);
}

}  // namespace tavo
