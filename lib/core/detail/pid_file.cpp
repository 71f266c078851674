// Pid files, and signals to the processes that they name.
#include "core/detail/pid_file.h"

#include "core/detail/open_file.h"

#include <algorithm>
#include <charconv>
#include <csignal>
#include <cstdio>

#include <sys/syscall.h>

namespace tavo {
namespace {

constexpr pid_t kLargestPidEver = 4194304;  // the largest value of the kernel's own setting

struct PidFile {
    pid_t pid;
    uid_t owner;
};

// Reads the first bytes of an open file: a pid file is shorter.
std::string_view ReadStart(int fd, char *buffer, size_t size) noexcept
{
    ssize_t got;
    do
        got = ::read(fd, buffer, size);
    while (got < 0 && errno == EINTR);
    return {buffer, got > 0 ? static_cast<size_t>(got) : 0};
}

pid_t LargestPid() noexcept
{
    const Fd fd = OpenFd("/proc/sys/kernel/pid_max", O_RDONLY);
    char buffer[32];
    const pid_t largest = fd ? ParsePid(ReadStart(fd.Get(), buffer, sizeof buffer), kLargestPidEver) : 0;
    return largest > 0 ? largest : kLargestPidEver;
}

std::optional<PidFile> Open(const char *path) noexcept
{
    const Fd fd = OpenRegular(path, O_RDONLY | (::geteuid() == 0 ? O_NOFOLLOW : 0));
    struct stat st;
    if (!fd || ::fstat(fd.Get(), &st) != 0)
        return std::nullopt;
    // A file that others may write to may say anything.
    if ((st.st_mode & kWritableByOthers) != 0)
        return PidFile{0, st.st_uid};
    char buffer[256];
    return PidFile{ParsePid(ReadStart(fd.Get(), buffer, sizeof buffer), LargestPid()), st.st_uid};
}

// True when the owner of the file could signal the process anyway, and when there is no such process.
bool MaySpeakFor(const PidFile &file) noexcept
{
    if (file.owner == 0 || ::geteuid() != 0)
        return true;
    char name[32];
    std::snprintf(name, sizeof name, "/proc/%d", static_cast<int>(file.pid));
    struct stat st;
    if (::stat(name, &st) == 0)
        return st.st_uid == file.owner;
    return ::kill(file.pid, 0) != 0 && errno == ESRCH;
}

}  // namespace

pid_t ParsePid(std::string_view text, pid_t largest) noexcept
{
    constexpr std::string_view blanks = " \t\r\v\f";
    text = text.substr(0, text.find('\n'));
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
    pid_t pid = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), pid);
    if (error != std::errc() || pid < 1 || pid > largest)
        return 0;
    text.remove_prefix(static_cast<size_t>(end - text.data()));
    return text.find_first_not_of(blanks) == std::string_view::npos ? pid : 0;
}

std::optional<pid_t> ReadPidFile(const char *path) noexcept
{
    const std::optional<PidFile> file = Open(path);
    if (!file)
        return std::nullopt;
    return file->pid > 0 && MaySpeakFor(*file) ? file->pid : 0;
}

PidSignal SignalByPidFile(const char *path, int signal) noexcept
{
    const std::optional<PidFile> file = Open(path);
    if (!file || file->pid < 1)
        return PidSignal::no_pid;
    // Held from before the check until the signal is sent. Old kernels and emulators have no pidfd; then the pid has to
    // do.
    const Fd process(static_cast<int>(::syscall(SYS_pidfd_open, file->pid, 0u)));
    if (!process && errno == ESRCH)
        return PidSignal::failed;
    if (!MaySpeakFor(*file))
        return PidSignal::no_pid;
    if (process && ::syscall(SYS_pidfd_send_signal, process.Get(), signal, nullptr, 0u) == 0)
        return PidSignal::sent;
    if (process && errno != ENOSYS)
        return PidSignal::failed;
    return ::kill(file->pid, signal) == 0 ? PidSignal::sent : PidSignal::failed;
}

}  // namespace tavo
