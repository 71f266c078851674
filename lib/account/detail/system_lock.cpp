// Takes the system's lock on the password files.
#include "account/detail/system_lock.h"

#include "core/detail/open_file.h"

#include <ctime>

namespace tavo {
namespace {

constexpr char kPasswordLock[] = "/etc/.pwd.lock";
constexpr int kTriesEachSecond = 20;

// A number, not an owner: a destructor at the exit of the program would have to be registered when the library is loaded.
constinit int lock_file = -1;
constinit int holders = 0;

Fd TryFor(int seconds) noexcept
{
    Fd file = OpenFd(kPasswordLock, O_WRONLY | O_CREAT | O_NOFOLLOW, 0600);
    // A lock of the open file, not of the process: it excludes those of lckpwdf, and no other close in this process
    // drops it.
    struct flock whole = {};
    whole.l_type = F_WRLCK;
    whole.l_whence = SEEK_SET;
    for (int tries = seconds * kTriesEachSecond; file; --tries) {
        if (::fcntl(file.Get(), F_OFD_SETLK, &whole) == 0)
            break;
        if (tries <= 0 || (errno != EAGAIN && errno != EACCES && errno != EINTR))
            return Fd();
        const timespec pause{0, 1000000000 / kTriesEachSecond};
        ::nanosleep(&pause, nullptr);
    }
    return file;
}

}  // namespace

bool SystemLock::Take(int seconds) noexcept
{
    if (held_)
        return true;
    if (holders == 0)
        lock_file = TryFor(seconds).Release();
    held_ = lock_file >= 0;
    holders += held_ ? 1 : 0;
    return held_;
}

void SystemLock::Release() noexcept
{
    if (std::exchange(held_, false) && --holders == 0)
        Fd(std::exchange(lock_file, -1)).Reset();
}

}  // namespace tavo
