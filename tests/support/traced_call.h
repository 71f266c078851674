// Runs a piece of work in a child process under ptrace, and ends it or fails one of its system calls there: also those that
// the C library makes itself, which no interposed function sees.
//
//     const std::function<void()> work = [] { TheCall(); };
//     for (int n = 1; test::DiesAtCall(n, work); ++n)
//         ... what the next program finds ...
//
//     for (const test::SystemCall &call : test::DistinctCalls(test::SystemCallsOf(work)))
//         const test::Ending ending = test::FailsAtCall(call, EIO, work);
#ifndef TESTS_SUPPORT_TRACED_CALL_H
#define TESTS_SUPPORT_TRACED_CALL_H

#include <cstdint>
#include <functional>
#include <ostream>
#include <string>
#include <vector>

namespace test {

// Whether this process may trace a child. Containers often refuse it, and so do emulators of single programs: tests skip
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
    bool hung = false;                  // it did not end within the time limit, and was killed
    int status = 0;                     // as waitpid gives it
    std::vector<uintptr_t> stack = {};  // words of it when the call was failed: who made it

    bool IsClean() const { return !hung && status == 0; }
};

std::ostream &operator<<(std::ostream &out, const Ending &ending);

// The system calls of the work in their order; the last one, which ends the child, is left out, and so is everything
// outside of MarkCalls when the work has such marks. Programs that the child starts are not traced.
std::vector<SystemCall> SystemCallsOf(const std::function<void()> &work);

// Called before and after the part of the work whose system calls are meant.
void MarkCalls();

// The first one from each site, without those that cannot fail (getpid) or whose failure is not an errno (brk).
std::vector<SystemCall> DistinctCalls(const std::vector<SystemCall> &calls);
bool CanFail(const SystemCall &call);

// This system call of the work is not made and gives -1 with `error`; only close is made, as a kernel does that reports an
// error of what was written before. Everything after it is as usual. A signal may come elsewhere than it did when the calls
// were counted: it is then the next call of that kind.
Ending FailsAtCall(const SystemCall &which, int error, const std::function<void()> &work, int seconds = 20);

// The child is killed before it makes its Nth system call. False when it came to its end before that.
bool DiesAtCall(int n, const std::function<void()> &work);

}  // namespace test

#endif
