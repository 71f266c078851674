// Finds a daemon among the running processes by its name.
#include "service/detail/process_named.h"

#include "core/detail/process_list.h"
#include "core/detail/text_fields.h"

#include <algorithm>

namespace tavo {
namespace {

// "/usr/sbin/ftpd" and "ftpd:" (a daemon that appends its activity to its name) are "ftpd".
std::string_view PlainName(std::string_view word) noexcept
{
    word.remove_prefix(word.rfind('/') + 1);
    if (word.ends_with(':'))
        word.remove_suffix(1);
    return word;
}

bool IsShell(std::string_view name) noexcept
{
    return name == "sh" || name == "bash" || name == "ash" || name == "dash" || name == "busybox";
}

}  // namespace

bool CommandHasName(std::string_view command, std::string_view name)
{
    if (command.starts_with('[') && command.ends_with(']'))
        return command == name || command.substr(1, command.size() - 2) == name;
    for (const std::string_view word : SplitFields(command)) {
        const std::string_view plain = PlainName(word);
        if (plain == name)
            return true;
        if (!IsShell(plain))  // a script's own name follows its shell's
            return false;
    }
    return false;
}

bool IsProcessNamed(std::string_view name)
{
    const auto processes = ListProcesses();
    return std::any_of(processes.begin(), processes.end(),
                       [&](const Process &process) { return CommandHasName(process.command, name); });
}

}  // namespace tavo
