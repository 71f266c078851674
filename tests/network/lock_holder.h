// Another process that holds locks.
#ifndef TESTS_NETWORK_LOCK_HOLDER_H
#define TESTS_NETWORK_LOCK_HOLDER_H

#include "tavo_lock.h"

#include "support/own_child.h"
#include "support/test.h"

namespace test {

// Holds them until it goes.
class LockHolder {
  public:
    explicit LockHolder(unsigned request)
    {
        int ends[2];
        EXPECT_EQ(::pipe2(ends, O_CLOEXEC), 0);
        child_.emplace([&] {
            if (ErrTLIBFileLock(request, 5) == 0 && ::write(ends[1], "", 1) == 1)
                ::pause();
        });
        ::close(ends[1]);
        char byte;
        EXPECT_EQ(::read(ends[0], &byte, 1), 1);
        ::close(ends[0]);
    }

  private:
    std::optional<OwnChild> child_;
};

}  // namespace test

#endif
