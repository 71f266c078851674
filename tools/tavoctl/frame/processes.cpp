// Running processes, as the process table has them.
#include "frame/processes.h"

#include "tavo_proc.h"

#include "frame/failure.h"
#include "frame/files.h"

#include <algorithm>
#include <ctime>
#include <fstream>
#include <limits>
#include <sstream>

#include <unistd.h>

namespace tavoctl {
namespace {

constexpr std::size_t usual_room = 64;

bool IsShell(const std::string &name)
{
    return name == "sh" || name == "bash" || name == "ash" || name == "dash" || name == "busybox";
}

// The word without its folder, and without the ":" that a daemon appends to its name before a description.
std::string PlainName(const std::string &word)
{
    std::string name = word.substr(word.rfind('/') + 1);
    if (name.ends_with(':'))
        name.pop_back();
    return name;
}

// A script's own name follows its shell's.
bool Runs(const std::string &command, const std::string &name)
{
    if (command == "[" + name + "]")
        return true;
    std::istringstream words(command);
    for (std::string word; words >> word;) {
        if (PlainName(word) == name)
            return true;
        if (!IsShell(PlainName(word)))
            return false;
    }
    return false;
}

// Seconds since 1970 at which the machine was started.
int64_t BootTime()
{
    std::ifstream in("/proc/stat");
    std::string name;
    for (int64_t value = 0; in >> name;) {
        if (name == "btime" && in >> value)
            return value;
        in.ignore(std::numeric_limits<std::streamsize>::max(), '\n');
    }
    return 0;
}

}  // namespace

std::vector<pid_t> MatchingProcesses(const std::string &pattern)
{
    std::vector<pid_t> pids(usual_room);
    for (;;) {
        const int count = TLIBPs(pattern.c_str(), pids.data(), static_cast<int>(pids.size()));
        Must(count >= 0, "find " + pattern);
        const bool all = static_cast<std::size_t>(count) <= pids.size();
        pids.resize(static_cast<std::size_t>(count));
        if (all)
            return pids;
    }
}

std::string CommandLine(pid_t pid)
{
    const std::string folder = "/proc/" + std::to_string(pid);
    std::string words = FileText(folder + "/cmdline");
    while (words.ends_with('\0'))
        words.pop_back();
    std::replace(words.begin(), words.end(), '\0', ' ');
    const std::string stat = words.empty() ? FileText(folder + "/stat") : "";
    const std::size_t name = stat.find('(');
    const std::size_t end = stat.rfind(") ");
    if (name == std::string::npos || end == std::string::npos || stat.compare(end + 2, 1, "Z") == 0)
        return words;
    return "[" + stat.substr(name + 1, end - name - 1) + "]";
}

pid_t ProcessOf(const std::string &name)
{
    for (const pid_t pid : MatchingProcesses(name))
        if (pid != ::getpid() && Runs(CommandLine(pid), name))
            return pid;
    return 0;
}

std::string StartOf(pid_t pid)
{
    // The name, in parentheses, may hold anything; the start is the 20th field after it, in clock ticks since the boot.
    constexpr int start_field = 20;
    const std::string stat = FileText("/proc/" + std::to_string(pid) + "/stat");
    const std::size_t behind_name = stat.rfind(") ");
    if (behind_name == std::string::npos)
        return {};
    std::istringstream fields(stat.substr(behind_name + 2));
    std::string field;
    for (int i = 0; i < start_field && fields >> field; ++i)
        ;
    const std::time_t start = BootTime() + std::strtoll(field.c_str(), nullptr, 10) / ::sysconf(_SC_CLK_TCK);
    std::tm local = {};
    char text[40];
    if (!::localtime_r(&start, &local) || !std::strftime(text, sizeof text, "%F %T%z", &local))
        return {};
    return std::string(text).insert(std::string_view(text).size() - 2, ":");
}

}  // namespace tavoctl
