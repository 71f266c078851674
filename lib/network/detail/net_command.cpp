// The commands that change the network.
#include "network/detail/net_command.h"

#include "core/detail/child_process.h"
#include "core/detail/child_status.h"
#include "network/detail/checkpoint.h"
#include "network/detail/process_identity.h"

namespace tavo {

int RunNetText(const std::string &command, bool quietly)
{
    const KeepChildStatus keep;
    Checkpoint::NoteCommand(0, "-", command);
    const pid_t pid = StartCommand(command, quietly ? kNullDevice : kInherited, quietly ? kNullDevice : kInherited);
    if (pid < 0)
        return -1;
    const std::string beginning = BeginningOf(pid);
    Checkpoint::NoteCommand(pid, beginning, command);
    const int status = CollectChild(pid);
    if (status == -1)
        EndProcess(pid, beginning);  // a command that could not be waited for must not run beside the next step
    return status;
}

}  // namespace tavo
