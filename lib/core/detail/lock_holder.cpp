// Finds the holder of a lock that could not be taken.
#include "core/detail/lock_holder.h"

#include "core/detail/open_file.h"

#include <cstring>

#include <sys/sysmacros.h>

namespace tavo {
namespace {

// Parses a line such as "7: FLOCK  ADVISORY  WRITE 708 00:13:1234 0 EOF": the pid when the line is about an flock of
// the file, else 0. Lines of waiting processes have "->" before the kind.
pid_t HolderIn(const char *line, const struct stat &file) noexcept
{
    int pid = 0;
    unsigned device_major = 0, device_minor = 0;
    unsigned long long inode = 0;
    if (std::sscanf(line, "%*[0-9]: FLOCK %*s %*s %d %x:%x:%llu", &pid, &device_major, &device_minor, &inode) != 4)
        return 0;
    const bool same = inode == file.st_ino && device_major == major(file.st_dev) && device_minor == minor(file.st_dev);
    return same && pid > 0 ? pid : 0;
}

}  // namespace

LockHolder FindLockHolder(const char *path) noexcept
{
    LockHolder holder;
    struct stat file;
    if (::lstat(path, &file) != 0)
        return holder;
    char line[256];
    const File locks = OpenToRead("/proc/locks");
    while (locks && holder.pid == 0 && std::fgets(line, sizeof line, locks.Get()))
        holder.pid = HolderIn(line, file);
    if (holder.pid == 0)
        return holder;
    std::snprintf(line, sizeof line, "/proc/%d/comm", static_cast<int>(holder.pid));
    const Fd comm = OpenFd(line, O_RDONLY);
    const ssize_t length = comm ? ::read(comm.Get(), holder.name, sizeof holder.name - 1) : -1;
    if (length > 0) {
        holder.name[length] = '\0';
        holder.name[std::strcspn(holder.name, "\n")] = '\0';
    }
    return holder;
}

}  // namespace tavo
