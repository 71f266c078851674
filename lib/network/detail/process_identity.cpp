// A process that is still the same one.
#include "network/detail/process_identity.h"

#include "core/detail/process_list.h"
#include "core/detail/strict_number.h"
#include "core/detail/text_fields.h"
#include "network/detail/kernel_interface.h"

#include <algorithm>
#include <csignal>

#include <unistd.h>

namespace tavo {

namespace {

// A field of /proc/PID/stat, counted from the one that follows the name.
std::string StatField(pid_t pid, size_t number)
{
    const std::string stat = ReadKernelFile(("/proc/" + std::to_string(pid) + "/stat").c_str()).value_or("");
    const auto field = SplitFields(std::string_view(stat).substr(std::min(stat.rfind(')') + 1, stat.size())));
    return field.size() > number ? std::string(field[number]) : "";
}

}  // namespace

std::string BeginningOf(pid_t pid)
{
    constexpr size_t start_time = 19;
    return StatField(pid, start_time);
}

bool IsAncestor(pid_t pid)
{
    constexpr size_t parent = 1;
    pid_t found = ::getppid();
    while (found > 1 && found != pid)
        found = ToPid(StatField(found, parent));
    return found == pid;
}

void EndProcess(pid_t pid, std::string_view beginning)
{
    if (pid <= 0 || beginning.empty() || BeginningOf(pid) != beginning)
        return;
    ::kill(pid, SIGKILL);
    constexpr int rounds = 100;
    for (int i = 0; i < rounds && BeginningOf(pid) == beginning && !IsZombie(pid); ++i)
        ::usleep(10000);
}

pid_t ToPid(std::string_view text)
{
    return LeadingNumber<pid_t>(text);
}

}  // namespace tavo
