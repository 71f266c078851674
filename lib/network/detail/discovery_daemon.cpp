// The discovery daemon as its callers see it.
#include "network/detail/discovery_daemon.h"

#include "tavo_proc.h"

#include "core/detail/open_file.h"
#include "core/detail/strict_number.h"
#include "core/detail/text_fields.h"
#include "network/detail/host_list.h"
#include "network/detail/kernel_interface.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace tavo {
namespace {

constexpr const char *kDaemon = "/usr/tavo/bin/findhostd";
constexpr const char *kPidFile = "/var/run/findhostd.pid";
constexpr unsigned kStartSeconds = 3;

bool IsRoots(pid_t pid)
{
    struct stat st;
    return pid > 0 && ::stat(("/proc/" + std::to_string(pid)).c_str(), &st) == 0 && st.st_uid == 0;
}

// In another's folder what is in the way can only be moved, be it a folder with files in it.
bool MoveAside(const char *path)
{
    if (::unlink(path) == 0 || errno == ENOENT)
        return true;
    if (errno != EISDIR && errno != EPERM)
        return false;
    char aside[] = "/tmp/.tavods.aside.XXXXXX";
    return ::mkdtemp(aside) && std::rename(path, aside) == 0;
}

bool IsOurs(const struct stat &st)
{
    return S_ISREG(st.st_mode) && st.st_nlink == 1 && (st.st_uid == 0 || st.st_uid == ::geteuid());
}

}  // namespace

bool IsDiscoveryAlive()
{
    struct stat st;
    if (::lstat(kPidFile, &st) != 0 || !S_ISREG(st.st_mode))
        return false;
    const std::string locks = ReadKernelFile("/proc/locks").value_or("");
    // "1: FLOCK  ADVISORY  WRITE 812 00:1a:4711 0 EOF"
    for (std::string_view rest = locks; !rest.empty();) {
        const auto field = SplitFields(TakeLine(rest));
        if (field.size() < 6 || field[1] != "FLOCK" || field[3] != "WRITE")
            continue;
        const std::string_view inode = field[5].substr(field[5].rfind(':') + 1);
        if (StrictNumber<unsigned long long>(inode).value_or(0) == st.st_ino &&
            IsRoots(StrictNumber<pid_t>(field[4]).value_or(0)))
            return true;
    }
    return false;
}

bool StartDiscovery()
{
    TLIBExec(kDaemon, nullptr);
    ::sleep(kStartSeconds);
    return TLIBReadPidFile(kPidFile) > 0;
}

bool MakeHostList()
{
    struct stat st;
    if (::lstat(kHostList, &st) == 0 && IsOurs(st))
        return true;
    return MoveAside(kHostList) && OpenFd(kHostList, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, 0644);
}

Fd OpenHostList(const char *path)
{
    Fd fd = OpenRegular(path, O_RDONLY | O_NOFOLLOW);
    struct stat st;
    if (!fd)
        return fd;
    if (::fstat(fd.Get(), &st) != 0 || (st.st_uid != 0 && st.st_uid != ::geteuid())) {
        fd.Reset();
        errno = EPERM;
    }
    return fd;
}

}  // namespace tavo
