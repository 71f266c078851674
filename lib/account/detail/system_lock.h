// The lock that passwd, useradd and vipw take on the system's password files.
#ifndef TAVO_ACCOUNT_DETAIL_SYSTEM_LOCK_H
#define TAVO_ACCOUNT_DETAIL_SYSTEM_LOCK_H

namespace tavo {

// The same lock that lckpwdf takes, without its alarm signal and its 15 seconds. It nests within the process: a change
// of users goes on to change groups.
class SystemLock {
  public:
    SystemLock() = default;
    ~SystemLock() { Release(); }
    SystemLock(const SystemLock &) = delete;
    SystemLock &operator=(const SystemLock &) = delete;

    // Tries until `seconds` have passed; false when another process still holds it, or there is no /etc to lock in.
    bool Take(int seconds) noexcept;
    void Release() noexcept;

  private:
    bool held_ = false;
};

}  // namespace tavo

#endif
