// Locks of the library while a verb works.
#include "frame/held_locks.h"

#include "tavo_lock.h"

#include "frame/failure.h"
#include "frame/terminal.h"

#include <string_view>

namespace tavoctl {
namespace {

std::string NamesOf(unsigned mask)
{
    std::string names;
    for (const TLIBLOCKFILE *lock = rgslckList; lock->fLockBit; ++lock)
        if (mask & lock->fLockBit)
            names += (names.empty() ? "" : ",") + LockName(lock->szPath);
    return names;
}

// At a terminal the reason for the delay is shown; then the wait proceeds second by second.
bool Take(unsigned request, int timeout, const std::string &names)
{
    if (!Progress::Visible())
        return ErrTLIBFileLock(request, timeout) == 0;
    if (ErrTLIBFileLock(request, 0) == 0)
        return true;
    Progress progress("waiting for the lock " + names);
    for (int left = timeout; left > 0; --left) {
        progress.Show(std::to_string(left) + " s left");
        if (ErrTLIBFileLock(request, 1) == 0)
            return true;
    }
    return false;
}

}  // namespace

std::string LockName(const char *path)
{
    const std::string_view whole = path;
    constexpr std::string_view prefix = "/lock_";
    const std::size_t at = whole.rfind(prefix);
    return std::string(at == std::string_view::npos ? whole : whole.substr(at + prefix.size()));
}

HeldLocks::HeldLocks(unsigned mask, bool shared, int64_t timeout) : mask_(mask)
{
    const unsigned way = TAVO_LOCK_NONBLOCKING | (shared ? TAVO_LOCK_SHARED : TAVO_LOCK_EXCLUSIVE);
    const std::string names = NamesOf(mask);
    Must(Take(mask | way, static_cast<int>(timeout), names), "take the lock " + names);
}

HeldLocks::~HeldLocks()
{
    ErrTLIBFileUnlock(mask_);
}

}  // namespace tavoctl
