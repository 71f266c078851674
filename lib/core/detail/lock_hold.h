// Holds locks of tavo_lock.h for a scope.
//
//     const LockHold lock(TAVO_LOCK_USER | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 5);
//     if (!lock)
//         return -1;  // ErrTLIBFileLock has recorded why
#ifndef TAVO_CORE_DETAIL_LOCK_HOLD_H
#define TAVO_CORE_DETAIL_LOCK_HOLD_H

#include "tavo_lock.h"

#include "core/detail/keep_fault.h"
#include "core/detail/owner.h"

namespace tavo {

class LockHold {
  public:
    LockHold(unsigned request, int timeout) noexcept : request_(request), held_(ErrTLIBFileLock(request, timeout) == 0)
    {
    }
    ~LockHold() { Release(); }
    LockHold(const LockHold &) = delete;
    LockHold &operator=(const LockHold &) = delete;

    explicit operator bool() const noexcept { return held_; }

    // Releases before the scope ends, for example before a script runs that takes the lock itself.
    void Release() noexcept
    {
        if (!std::exchange(held_, false))
            return;
        const KeepErrno keep;
        const KeepFault keep_fault;  // closing the file releases the lock, too
        ErrTLIBFileUnlock(request_);
    }

  private:
    unsigned request_;
    bool held_;
};

}  // namespace tavo

#endif
