// The one gate to files in directories in which everybody may create names.
#include "core/detail/trusted_file.h"

#include "core/detail/file_target.h"
#include "core/detail/open_file.h"

#include <cerrno>
#include <cstdint>
#include <cstdio>

#include <sys/random.h>

namespace tavo {
namespace {

// Random names need no second try, except on a machine whose random source is not ready.
constexpr int kAsideTries = 16;

// Never replaces another file. Where the kernel or file system lacks such a rename, the new name is at least a random
// one.
bool RenameAside(const char *from, const char *to) noexcept
{
    if (::renameat2(AT_FDCWD, from, AT_FDCWD, to, RENAME_NOREPLACE) == 0)
        return true;
    return (errno == ENOSYS || errno == EINVAL) && ::rename(from, to) == 0;
}

bool IsSameFile(const struct stat &a, const struct stat &b) noexcept
{
    return a.st_dev == b.st_dev && a.st_ino == b.st_ino;
}

}  // namespace

bool IsInPublicDirectory(const char *path)
{
    struct stat st;
    return ::stat(DirectoryOf(path).c_str(), &st) == 0 && (st.st_mode & S_IWOTH) != 0;
}

bool IsTrusted(const struct stat &st) noexcept
{
    const bool our_owner = st.st_uid == 0 || st.st_uid == ::geteuid();
    return our_owner && (S_ISDIR(st.st_mode) || st.st_nlink == 1);
}

Fd OpenTrusted(const char *path, int flags, mode_t mode)
{
    return IsInPublicDirectory(path) ? OpenTrustedRegular(path, flags, mode) : OpenFd(path, flags, mode);
}

Fd OpenTrustedRegular(const char *path, int flags, mode_t mode)
{
    if (!IsInPublicDirectory(path))
        return OpenRegular(path, flags, mode);
    Fd fd = OpenRegular(path, (flags & ~O_TRUNC) | O_NOFOLLOW, mode);
    struct stat st;
    if (!fd || ::fstat(fd.Get(), &st) != 0)
        return Fd();
    if (!IsTrusted(st)) {
        errno = EPERM;
        return Fd();
    }
    if ((flags & O_TRUNC) != 0 && ::ftruncate(fd.Get(), 0) != 0)
        return Fd();
    return fd;
}

std::string MoveForeignAside(const std::string &path)
{
    struct stat seen, moved;
    for (int tries = 0; tries < kAsideTries; ++tries) {
        if (::lstat(path.c_str(), &seen) != 0 || IsTrusted(seen))
            return {};
        uint32_t random[2] = {};
        if (::getrandom(random, sizeof random, GRND_NONBLOCK) < 0)
            random[0] = static_cast<uint32_t>(tries);
        char ending[32];
        std::snprintf(ending, sizeof ending, ".foreign-%08x%08x", random[0], random[1]);
        std::string aside = path + ending;
        if (!RenameAside(path.c_str(), aside.c_str())) {
            if (errno == EEXIST || errno == ENOENT)
                continue;
            return {};
        }
        if (::lstat(aside.c_str(), &moved) == 0 && (IsSameFile(seen, moved) || !IsTrusted(moved)))
            return aside;
        // Another process has cleared the name in between; its own file goes back.
        RenameAside(aside.c_str(), path.c_str());
    }
    return {};
}

}  // namespace tavo
