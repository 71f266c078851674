// Runs a part of a test as a local user without rights.
#ifndef TESTS_ACCOUNT_USER_AS_NOBODY_H
#define TESTS_ACCOUNT_USER_AS_NOBODY_H

#include "support/test.h"

#include <grp.h>

namespace test {

inline constexpr uid_t kNobody = 65534;

// For good: only in a child. False where only one user id is mapped.
inline bool BecomeNobody()
{
    return ::setgroups(0, nullptr) == 0 && ::setresgid(kNobody, kNobody, kNobody) == 0 &&
           ::setresuid(kNobody, kNobody, kNobody) == 0;
}

inline bool CanBecomeNobody()
{
    const pid_t child = ::fork();
    if (child == 0)
        ::_exit(BecomeNobody() ? 0 : 1);
    int status = -1;
    ::waitpid(child, &status, 0);
    return status == 0;
}

// What `body` says in a process of that user.
template <class Body>
std::string AsNobody(Body body)
{
    int ends[2];
    if (::pipe(ends) != 0)
        return "no pipe";
    const pid_t child = ::fork();
    if (child == 0) {
        const std::string text = BecomeNobody() ? body() : "could not become nobody";
        ::_exit(::write(ends[1], text.data(), text.size()) == ssize_t(text.size()) ? 0 : 1);
    }
    ::close(ends[1]);
    std::string text;
    char part[4096];
    for (ssize_t got; (got = ::read(ends[0], part, sizeof part)) > 0;)
        text.append(part, size_t(got));
    ::close(ends[0]);
    int status = -1;
    ::waitpid(child, &status, 0);
    return status == 0 ? text : "died: " + std::to_string(status) + " after " + text;
}

}  // namespace test

#endif
