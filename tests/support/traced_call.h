// Runs a piece of work in a child process under ptrace, and kills it or fails one of its system calls there. This
// includes the calls of the C library itself, which no interposed function sees.
//
//     const std::function<void()> work = [] { TheCall(); };
//     for (int n = 1; test::DiesAtCall(n, work); ++n)
//         ... what the next program finds ...
//
//     for (const test::SystemCall &call : test::DistinctCalls(test::SystemCallsOf(work)))
//         const test::Ending ending = test::FailsAtCall(call, EIO, work);
#ifndef TESTS_SUPPORT_TRACED_CALL_H
#define TESTS_SUPPORT_TRACED_CALL_H

#include "support/test.h"

#include <cstdint>

namespace test {

// Whether this process may trace a child. Containers and emulators of single programs often refuse it: tests skip
// themselves by name there.
bool CanTrace();

struct SystemCall {
    int index = 0;      // 1 for the first one of the work
    long number = 0;    // SYS_openat, ...
    uint64_t site = 0;  // equal for calls from one place in the program, such as the rounds of a loop

    std::string Name() const;  // "openat"; the number where the name is not known
};

// How the child ended.
struct Ending {
    bool reached = false;               // the child made that many system calls
    bool hung = false;                  // it exceeded the time limit and was killed
    int status = 0;                     // as waitpid gives it
    std::vector<uintptr_t> stack = {};  // words of it when the call was failed: its caller

    bool IsClean() const { return !hung && status == 0; }
};

std::ostream &operator<<(std::ostream &out, const Ending &ending);

// Returns the system calls of the work in their order, without the last one, which ends the child. If the work calls
// MarkCalls, only the calls between the marks count. Programs that the child starts are not traced.
std::vector<SystemCall> SystemCallsOf(const std::function<void()> &work);

// Called before and after the part of the work whose system calls count.
void MarkCalls();

// The first one from each site, without those that cannot fail (getpid) or whose failure is not an errno (brk).
std::vector<SystemCall> DistinctCalls(const std::vector<SystemCall> &calls);
bool CanFail(const SystemCall &call);

// Fails this system call of the work with `error` instead of making it. Only close is made, as in a kernel that reports
// an error of an earlier write. Everything after it is as usual. A signal may arrive elsewhere than it did when the
// calls were counted: then the next call of that kind fails.
Ending FailsAtCall(const SystemCall &which, int error, const std::function<void()> &work, int seconds = 20);

// Kills the child before it makes its Nth system call. False when it ended before that.
bool DiesAtCall(int n, const std::function<void()> &work);

}  // namespace test

#endif
