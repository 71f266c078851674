// The calls that a rewrite is made of, in place of the C library's: one of them ends the process, or fails.
#ifndef TESTS_FAULT_REWRITE_INTERPOSED_CALLS_H
#define TESTS_FAULT_REWRITE_INTERPOSED_CALLS_H

namespace test {

constexpr int kDied = 77;  // the exit status of a process that was ended

// The n-th write, fsync, fchmod, fchown or rename from now on ends the process instead of being made; of a write, the
// first half is made. 0: none.
void DieAtCall(int n);

// The n-th of these calls from now on stops the process (SIGSTOP) before it is made.
void StopAtCall(int n);

// How many of these calls there were since.
int CallsMade();

enum class Call { none, fstat, write, fsync_file, fsync_directory, fchmod, fchown, rename, flock };

// From now on these calls fail with this errno.
void FailCalls(Call call, int error);

// The name that the last rename took away.
const char *RenamedFrom();

// How often each was made since the last question.
struct Syncs {
    int files = 0;
    int directories = 0;
};
Syncs TakeSyncs();

}  // namespace test

#endif
