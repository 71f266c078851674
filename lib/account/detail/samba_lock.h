// The lock that Samba's own programs take on its password file while they change it in place.
#ifndef TAVO_ACCOUNT_DETAIL_SAMBA_LOCK_H
#define TAVO_ACCOUNT_DETAIL_SAMBA_LOCK_H

#include "core/detail/owner.h"
#include "core/detail/result.h"

namespace tavo {

// Excludes processes that lock the file with process locks (smbd, smbpasswd). The lock belongs to the open file:
// closing another descriptor in this process does not drop it. Tries until `seconds` have passed.
bool LockOpenFile(int fd, int seconds) noexcept;

class SambaLock {
  public:
    // Locks the file that has the name when the lock is held: a program that waited for a file which was replaced
    // meanwhile opens the new one, and so do we. 0, also when there is no such file; ERR_LOCK_FAILED.
    Code Take(int seconds) noexcept;

    // Locks the new file before it gets the name, so that it does not change until its time stamps are recorded.
    void TakeNew(int fd) noexcept;

    // After a replacement the programs that waited for the old file finish first.
    void Release() noexcept;

  private:
    Fd old_;
    Fd new_;
};

}  // namespace tavo

#endif
