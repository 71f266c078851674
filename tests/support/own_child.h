// Children of a test's own.
#ifndef TESTS_CORE_PROC_OWN_CHILD_H
#define TESTS_CORE_PROC_OWN_CHILD_H

#include "support/test.h"

// An appliance root that is entered by chroot alone has no /proc.
#define SKIP_WITHOUT_PROC()                                                                                            \
    if (::access("/proc/self/stat", F_OK) != 0)                                                                        \
    GTEST_SKIP() << "needs /proc"

namespace test {

// Killed and collected by the destructor.
class OwnChild {
  public:
    template <class Body>
    explicit OwnChild(Body body) : pid_(::fork())
    {
        if (pid_ == 0) {
            body();
            ::_exit(0);
        }
    }
    ~OwnChild()
    {
        if (pid_ > 0)
            ::kill(pid_, SIGKILL);
        Status();
    }
    OwnChild(const OwnChild &) = delete;
    OwnChild &operator=(const OwnChild &) = delete;

    pid_t Pid() const { return pid_; }
    int Status()
    {
        int status = -1;
        if (pid_ > 0)
            ::waitpid(pid_, &status, 0);
        pid_ = 0;
        return status;
    }

  private:
    pid_t pid_;
};

// Runs `body` in a process of its own and returns its result.
template <class Body>
int InChild(Body body)
{
    OwnChild child([&] { ::_exit(body()); });
    const int status = child.Status();
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

// A process of another user, which waits for a signal.
inline void BecomeAndWait(uid_t uid)
{
    if (::setresuid(uid, uid, uid) != 0)
        ::_exit(1);
    for (;;)
        ::pause();
}

// The action of SIGCHLD for a scope.
class ChildAction {
  public:
    ChildAction(void (*handler)(int), int flags)
    {
        struct sigaction action = {};
        action.sa_handler = handler;
        action.sa_flags = flags;
        ::sigaction(SIGCHLD, &action, &saved_);
    }
    ~ChildAction() { ::sigaction(SIGCHLD, &saved_, nullptr); }
    ChildAction(const ChildAction &) = delete;
    ChildAction &operator=(const ChildAction &) = delete;

  private:
    struct sigaction saved_;
};

inline bool HasNoChildren()
{
    return ::waitpid(-1, nullptr, WNOHANG) == -1 && errno == ECHILD;
}

}  // namespace test

#endif
