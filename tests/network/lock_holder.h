// Another process that holds locks.
#ifndef TESTS_NETWORK_LOCK_HOLDER_H
#define TESTS_NETWORK_LOCK_HOLDER_H

#include "tavo_lock.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace test {

// Holds them until it goes.
class LockHolder {
  public:
    explicit LockHolder(unsigned request)
    {
        int ready[2];
        EXPECT_EQ(::pipe2(ends_, O_CLOEXEC), 0);
        EXPECT_EQ(::pipe2(ready, O_CLOEXEC), 0);
        pid_ = ::fork();
        char byte = 0;
        if (pid_ == 0) {
            ::close(ends_[1]);
            if (ErrTLIBFileLock(request, 5) != 0 || ::write(ready[1], &byte, 1) != 1)
                ::_exit(1);
            ::_exit(::read(ends_[0], &byte, 1) == 0 ? 0 : 1);
        }
        ::close(ready[1]);
        EXPECT_EQ(::read(ready[0], &byte, 1), 1);
        ::close(ready[0]);
    }
    ~LockHolder()
    {
        ::close(ends_[1]);
        ::close(ends_[0]);
        ::waitpid(pid_, nullptr, 0);
    }
    LockHolder(const LockHolder &) = delete;
    LockHolder &operator=(const LockHolder &) = delete;

  private:
    int ends_[2];
    pid_t pid_;
};

}  // namespace test

#endif
