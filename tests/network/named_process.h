// A process of a test's own that bears another program's name.
#ifndef TESTS_NETWORK_NAMED_PROCESS_H
#define TESTS_NETWORK_NAMED_PROCESS_H

#include "support/eventually.h"
#include "support/scratch_dir.h"

#include <gtest/gtest.h>

#include <string>

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace test {

// Waits, harmless, until End or its own end.
class NamedProcess {
  public:
    explicit NamedProcess(const std::string &name, const char *argument = "none")
    {
        int ends[2];
        EXPECT_EQ(::pipe2(ends, O_CLOEXEC), 0);
        pid_ = ::fork();
        if (pid_ == 0) {
            ::dup2(ends[0], 0);
            ::execl("/bin/bash", name.c_str(), "-c", "read x; :", "-f", argument, nullptr);
            ::_exit(127);
        }
        ::close(ends[0]);
        input_ = ends[1];
        const std::string line = "/proc/" + std::to_string(pid_) + "/cmdline";
        EXPECT_TRUE(Eventually([&] { return ReadFile(line).starts_with(name); }));
    }
    ~NamedProcess()
    {
        if (input_ >= 0)
            End();
    }
    NamedProcess(const NamedProcess &) = delete;
    NamedProcess &operator=(const NamedProcess &) = delete;

    // The signal that it died of, 0 for none.
    int End()
    {
        ::close(input_);
        input_ = -1;
        int status = 0;
        ::waitpid(pid_, &status, 0);
        return WIFSIGNALED(status) ? WTERMSIG(status) : 0;
    }

    pid_t Pid() const { return pid_; }

  private:
    pid_t pid_ = -1;
    int input_ = -1;
};

}  // namespace test

#endif
