// A program that a test runs, and its outputs.
#ifndef TESTS_SUPPORT_RUNNING_PROGRAM_H
#define TESTS_SUPPORT_RUNNING_PROGRAM_H

#include "support/test.h"

#include <sys/types.h>

namespace test {

using Words = std::vector<std::string>;

struct Ran {
    int status;  // 128 plus the signal after a death by signal
    std::string out;
    std::string err;
};

std::ostream &operator<<(std::ostream &out, const Ran &ran);

int ShellStatus(int wait_status);

// Its name is the last part of the path.
[[noreturn]] void BecomeProgram(const std::string &path, const Words &words);

// Still running. Its outputs are pipes.
class RunningProgram {
  public:
    // Passes the input, which must fit into a pipe, to its standard input.
    RunningProgram(const std::string &path, const Words &words, const std::string &input = {});
    ~RunningProgram();  // kills it
    RunningProgram(const RunningProgram &) = delete;
    RunningProgram &operator=(const RunningProgram &) = delete;

    pid_t Pid() const { return pid_; }
    Ran Wait();

  private:
    pid_t pid_;
    int out_;
    int err_;
};

}  // namespace test

#endif
