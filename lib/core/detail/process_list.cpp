// The process table as /proc shows it.
#include "core/detail/process_list.h"

#include "core/detail/owner.h"

#include <algorithm>
#include <charconv>
#include <memory>
#include <new>

#include <dirent.h>
#include <fcntl.h>

namespace tavo {
namespace {

struct CloseDirectory {
    void operator()(DIR *directory) const noexcept { ::closedir(directory); }
};

// A small file of /proc; empty when the process has gone meanwhile.
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

std::string Command(int proc, const std::string &pid)
{
    std::string text = ReadSmall(proc, pid + "/cmdline");
    while (!text.empty() && text.back() == '\0')
        text.pop_back();
    if (text.empty()) {
        text = ReadSmall(proc, pid + "/comm");
        if (text.empty())
            return text;
        text.pop_back();
        text = "[" + text + "]";
    }
    // One process is one line, whatever it calls itself.
    std::replace(text.begin(), text.end(), '\0', ' ');
    std::replace(text.begin(), text.end(), '\n', '?');
    return text;
}

}  // namespace

std::vector<Process> ListProcesses()
{
    std::vector<Process> processes;
    Fd fd(::open("/proc", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!fd)
        return processes;
    const std::unique_ptr<DIR, CloseDirectory> directory(::fdopendir(fd.Get()));
    if (!directory)
        throw std::bad_alloc();  // an empty table would say that nobody runs
    const int proc = fd.Release();
    while (const dirent *entry = ::readdir(directory.get())) {
        const std::string name = entry->d_name;
        pid_t pid = 0;
        const auto [end, error] = std::from_chars(name.data(), name.data() + name.size(), pid);
        if (error != std::errc() || *end != 0 || pid < 1)
            continue;
        std::string command = Command(proc, name);
        if (!command.empty())
            processes.push_back({pid, std::move(command)});
    }
    std::sort(processes.begin(), processes.end(), [](const Process &a, const Process &b) { return a.pid < b.pid; });
    return processes;
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
