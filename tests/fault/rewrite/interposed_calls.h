// The calls that a rewrite is made of, in place of the C library's: one of them ends the process, or fails.
#ifndef TESTS_FAULT_REWRITE_INTERPOSED_CALLS_H
#define TESTS_FAULT_REWRITE_INTERPOSED_CALLS_H

namespace test {

constexpr int kDied = 77;  // the exit status of a process that was ended

// Before the n-th write, fsync, fchmod, fchown or rename from now on the process ends; of a write, the first half is
// made. 0: none.
void DieAtCall(int n);

// Before the n-th of these calls from now on the process stops (SIGSTOP).
void StopAtCall(int n);

// Of the calls of fstat all, or those of files that are open for writing and hold something.
enum class Call { none, fstat, fstat_written, read, write, fsync_file, fsync_directory, fchmod, fchown, rename, flock };

// From now on these calls fail with this errno.
void FailCalls(Call call, int error);

// The name that the last rename removed.
const char *RenamedFrom();

}  // namespace test

#endif
