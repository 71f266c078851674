// Locks of the library while a verb works.
#ifndef TAVOCTL_HELD_LOCKS_H
#define TAVOCTL_HELD_LOCKS_H

#include <cstdint>
#include <string>

namespace tavoctl {

// Seconds that a changing verb waits for its file's lock.
inline constexpr int usual_wait = 5;

// The name of a lock is its file's without "lock_".
std::string LockName(const char *path);

// Takes every lock of mask in its constructor, or throws a Failure after timeout seconds; its destructor releases them.
class HeldLocks {
  public:
    HeldLocks(unsigned mask, bool shared, int64_t timeout);
    ~HeldLocks();
    HeldLocks(const HeldLocks &) = delete;
    HeldLocks &operator=(const HeldLocks &) = delete;

  private:
    unsigned mask_;
};

}  // namespace tavoctl

#endif
