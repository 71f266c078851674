// Running a program, from a parent of any size.
#ifndef BENCH_CHILDREN_H
#define BENCH_CHILDREN_H

#include "tavo_proc.h"

#include "compare.h"

#include <cstdlib>

#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace bench {

inline uint64_t Collect(pid_t pid)
{
    int status = -1;
    ::waitpid(pid, &status, 0);
    return static_cast<uint64_t>(WEXITSTATUS(status));
}

inline uint64_t Spawn()
{
    char name[] = "false";
    char *const words[] = {name, nullptr};
    pid_t pid = -1;
    ::posix_spawn(&pid, "/bin/false", nullptr, nullptr, words, environ);
    return Collect(pid);
}

inline uint64_t Fork()
{
    const pid_t pid = ::fork();
    if (pid == 0) {
        ::execl("/bin/false", "false", nullptr);
        ::_exit(255);
    }
    return Collect(pid);
}

// `mebibytes` says how large the parent is. The child with a time limit is a copy of its parent, so that a program on a
// dead disk does not hold the parent up; it costs what fork costs.
inline void CompareChildren(int mebibytes)
{
    Compare("timed_child", mebibytes,
            {{"tavo",
              [] {
                  return static_cast<uint64_t>(TLIBTimedExec(60, "/bin/false", NULL));
              }},
             {"fork", Fork},
             {"system", [] {
                  return static_cast<uint64_t>(WEXITSTATUS(std::system("exec timeout 60 /bin/false")));
              }}});
    Compare("clean_child", mebibytes,
            {{"tavo",
              [] {
                  return static_cast<uint64_t>(TLIBExec("/bin/false", NULL));
              }},
             {"posix_spawn", Spawn},
             {"fork", Fork},
             {"system", [] {
                  return static_cast<uint64_t>(WEXITSTATUS(std::system("exec /bin/false")));
              }}});
}

}  // namespace bench

#endif
