// Ends a user's connections of the Windows file service.
#include "account/detail/smb_connections.h"

#include "core/detail/command_output.h"
#include "core/detail/run_command.h"
#include "core/detail/shell_command.h"
#include "core/detail/text_fields.h"

namespace tavo {

void EndSmbConnections(const std::string &user)
{
    if (::access("/usr/bin/smbcontrol", X_OK) != 0)
        return;
    const std::optional<std::string> list = ShellCommand("/usr/bin/smbstatus -b -u %s 2> /dev/null", user);
    if (!list)
        return;
    CommandOutput output(*list);
    for (std::string line; output.Next(line);) {
        const std::vector<std::string_view> fields = SplitFields(line);
        if (fields.size() < 2 || fields[1] != user ||
            fields[0].find_first_not_of("0123456789") != std::string_view::npos)
            continue;
        if (const auto command = ShellCommand("/usr/bin/smbcontrol %s shutdown > /dev/null 2>&1", fields[0]))
            RunCommand(*command);
    }
}

}  // namespace tavo
