// Opens, writes and syncs files for a library that runs as root.
#include "core/detail/open_file.h"

#include <string>

namespace tavo {

Fd OpenFd(const char *path, int flags, mode_t mode) noexcept
{
    for (;;) {
        const int fd = ::open(path, flags | O_CLOEXEC | O_NOCTTY | O_NONBLOCK, mode);
        if (fd >= 0 || errno != EINTR)
            return Fd(fd);
    }
}

Fd OpenRegular(const char *path, int flags, mode_t mode) noexcept
{
    Fd fd = OpenFd(path, flags, mode);
    struct stat st;
    if (!fd || ::fstat(fd.Get(), &st) != 0)
        return Fd();
    if (!S_ISREG(st.st_mode)) {
        errno = S_ISDIR(st.st_mode) ? EISDIR : EINVAL;
        return Fd();
    }
    return fd;
}

File OpenToRead(const char *path) noexcept
{
    Fd fd = OpenRegular(path, O_RDONLY);
    if (!fd)
        return File();
    File file(::fdopen(fd.Get(), "re"));
    if (file)
        fd.Release();
    return file;
}

bool IsInPublicDirectory(const char *path)
{
    const std::string_view whole = path;
    const size_t slash = whole.rfind('/');
    const std::string parent(slash == std::string_view::npos ? "." : slash == 0 ? "/" : whole.substr(0, slash));
    struct stat st;
    return ::stat(parent.c_str(), &st) == 0 && (st.st_mode & S_IWOTH) != 0;
}

Fd AboveStandard(Fd fd) noexcept
{
    if (!fd || fd.Get() > 2)
        return fd;
    return Fd(::fcntl(fd.Get(), F_DUPFD_CLOEXEC, 3));
}

bool WriteAll(int fd, std::string_view text) noexcept
{
    while (!text.empty()) {
        const ssize_t done = ::write(fd, text.data(), text.size());
        if (done >= 0)
            text.remove_prefix(static_cast<size_t>(done));
        else if (errno != EINTR)
            return false;
    }
    return true;
}

bool SyncFd(int fd) noexcept
{
    while (::fsync(fd) != 0) {
        if (errno == EINVAL || errno == EROFS)
            return true;
        if (errno != EINTR)
            return false;
    }
    return true;
}

}  // namespace tavo
