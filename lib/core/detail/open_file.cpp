// Opens, writes and syncs files for a library that runs as root.
#include "core/detail/open_file.h"

namespace tavo {
namespace {

int OpenOnce(const char *path, int flags, mode_t mode) noexcept
{
    for (;;) {
        const int fd = ::open(path, flags | O_CLOEXEC | O_NOCTTY | O_NONBLOCK, mode);
        if (fd >= 0 || errno != EINTR)
            return fd;
    }
}

}  // namespace

void RestoreMode(int fd, mode_t mode) noexcept
{
    const KeepErrno keep;
    struct stat st;
    if (::fstat(fd, &st) == 0 && (st.st_mode & kPermissions) != mode)
        ::fchmod(fd, mode);
}

Fd OpenFd(const char *path, int flags, mode_t mode) noexcept
{
    mode &= ~kWritableByOthers;
    if ((flags & O_CREAT) == 0)
        return Fd(OpenOnce(path, flags, mode));
    if ((flags & O_EXCL) == 0) {
        Fd existing(OpenOnce(path, flags & ~O_CREAT, mode));
        if (existing || errno != ENOENT)
            return existing;
    }
    Fd created(OpenOnce(path, flags | O_EXCL, mode));
    if (created) {
        RestoreMode(created.Get(), mode);
        return created;
    }
    if (errno != EEXIST || (flags & O_EXCL) != 0)
        return Fd();
    return Fd(OpenOnce(path, flags, mode));  // another process was faster, or a link leads to a missing file
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
