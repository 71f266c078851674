// The lock that Samba's own programs take on its password file.
#include "account/detail/samba_lock.h"

#include "tavo_error.h"

#include "account/detail/samba_latecomers.h"
#include "account/detail/store_family.h"
#include "core/detail/open_file.h"

#include <ctime>
#include <new>

namespace tavo {
namespace {

constexpr int kTriesInASecond = 20;
constexpr int kReplacements = 20;  // of the file, while we waited for it

bool HasTheName(int fd, const char *path)
{
    struct stat held;
    struct stat named;
    return ::fstat(fd, &held) == 0 && ::lstat(path, &named) == 0 && held.st_dev == named.st_dev &&
           held.st_ino == named.st_ino;
}

}  // namespace

bool LockOpenFile(int fd, int seconds) noexcept
{
    struct flock whole = {};
    whole.l_type = F_WRLCK;
    whole.l_whence = SEEK_SET;
    for (int tries = seconds * kTriesInASecond; ::fcntl(fd, F_OFD_SETLK, &whole) != 0; --tries) {
        if (tries <= 0 || (errno != EAGAIN && errno != EACCES && errno != EINTR))
            return false;
        const timespec pause{0, 1000000000 / kTriesInASecond};
        ::nanosleep(&pause, nullptr);
    }
    return true;
}

Code SambaLock::Take(int seconds) noexcept
{
    const char *path = kUserTextRows[kSmbText].path;
    for (int tries = 0; tries < kReplacements; ++tries) {
        old_ = OpenFd(path, O_RDWR | O_NOFOLLOW);
        if (!old_)
            return errno == EMFILE || errno == ENFILE || errno == ENOMEM ? ERR_LOCK_FAILED : ERR_SUCCESS;
        if (!LockOpenFile(old_.Get(), seconds))
            return ERR_LOCK_FAILED;
        if (HasTheName(old_.Get(), path))
            return 0;
    }
    return ERR_LOCK_FAILED;
}

void SambaLock::TakeNew(int fd) noexcept
{
    new_.Reset(::fcntl(fd, F_DUPFD_CLOEXEC, 0));
    if (new_)
        LockOpenFile(new_.Get(), 0);
}

void SambaLock::Release() noexcept
{
    try {
        if (old_ && new_ && HasTheName(new_.Get(), kUserTextRows[kSmbText].path))
            CarryOverLateLines(old_.Get(), new_.Get());
    } catch (const std::bad_alloc &) {
    }
    old_.Reset();
    new_.Reset();
}

}  // namespace tavo
