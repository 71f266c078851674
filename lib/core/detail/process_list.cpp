// Reads the process table from /proc.
#include "core/detail/process_list.h"

#include "core/detail/folder_reader.h"
#include "core/detail/strict_number.h"

#include <algorithm>
#include <new>

#include <fcntl.h>

namespace tavo {
namespace {

// Reads a small file of /proc; empty when the process has gone meanwhile.
std::string ReadSmall(int proc, const std::string &name)
{
    std::string text;
    const Fd fd(::openat(proc, name.c_str(), O_RDONLY | O_CLOEXEC));
    char piece[4096];
    while (fd) {
        const ssize_t got = ::read(fd.Get(), piece, sizeof piece);
        if (got > 0)
            text.append(piece, static_cast<size_t>(got));
        else if (got == 0 || errno != EINTR)
            break;
    }
    return text;
}

// The beginning of /proc/PID/stat: "PID (NAME) STATE ...".
struct Status {
    explicit Status(std::string_view text)
    {
        const size_t open = text.find('(');
        const size_t close = text.rfind(')');  // a name may hold any character
        if (open == text.npos || close == text.npos || close + 2 >= text.size())
            return;
        name = text.substr(open + 1, close - open - 1);
        state = text[close + 2];
    }

    // Ended, but kept in the table until its parent asks for the status.
    bool IsZombie() const { return state == 'Z' || state == 'X'; }

    std::string name;
    char state = 0;  // 0: there is no such process
};

// Empty when the process no longer runs.
std::string Command(int proc, const std::string &pid)
{
    std::string text = ReadSmall(proc, pid + "/cmdline");
    while (!text.empty() && text.back() == '\0')
        text.pop_back();
    if (text.empty()) {
        const Status status(ReadSmall(proc, pid + "/stat"));
        if (!status.state || status.IsZombie())
            return text;
        text = "[" + status.name + "]";
    }
    // Makes one line of one process, whatever its name contains.
    std::replace(text.begin(), text.end(), '\0', ' ');
    std::replace(text.begin(), text.end(), '\n', '?');
    return text;
}

}  // namespace

std::vector<Process> ListProcesses()
{
    std::vector<Process> processes;
    FolderReader proc("/proc");
    while (const char *const entry = proc.Next()) {
        const std::string name = entry;
        const std::optional<pid_t> pid = StrictNumber<pid_t>(name);
        if (!pid || *pid < 1)
            continue;
        std::string command = Command(proc.Descriptor(), name);
        if (!command.empty())
            processes.push_back({*pid, std::move(command)});
    }
    if (proc.Failed() && errno != ENOENT)
        throw std::bad_alloc();  // an incomplete table would hide running processes
    std::sort(processes.begin(), processes.end(), [](const Process &a, const Process &b) { return a.pid < b.pid; });
    return processes;
}

bool IsZombie(pid_t pid)
{
    const Fd proc(::open("/proc", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    return proc && Status(ReadSmall(proc.Get(), std::to_string(pid) + "/stat")).IsZombie();
}

std::string ProcessLine(const Process &process)
{
    return std::to_string(process.pid) + " " + process.command;
}

std::vector<pid_t> FindProcesses(std::string_view text)
{
    std::vector<pid_t> pids;
    for (const Process &process : ListProcesses()) {
        if (ProcessLine(process).find(text) != std::string::npos)
            pids.push_back(process.pid);
    }
    return pids;
}

}  // namespace tavo
