// Takes the system's lock on the password files.
#include "account/detail/system_lock.h"

#include "account/detail/samba_lock.h"
#include "core/detail/open_file.h"

namespace tavo {
namespace {

constexpr char kPasswordLock[] = "/etc/.pwd.lock";

// A number, not an owner: a destructor at the exit of the program would have to be registered when the library is loaded.
constinit int lock_file = -1;
constinit int holders = 0;

Fd TryFor(int seconds) noexcept
{
    Fd file = OpenFd(kPasswordLock, O_WRONLY | O_CREAT | O_NOFOLLOW, 0600);
    return file && LockOpenFile(file.Get(), seconds) ? std::move(file) : Fd();
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
