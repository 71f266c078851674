// A process of a test's own that bears another program's name.
#ifndef TESTS_NETWORK_NAMED_PROCESS_H
#define TESTS_NETWORK_NAMED_PROCESS_H

#include "support/own_child.h"
#include "support/test.h"

namespace test {

// Waits, harmless, until End or its own end.
class NamedProcess {
  public:
    explicit NamedProcess(const std::string &name, const char *argument = "none")
    {
        int ends[2];
        EXPECT_EQ(::pipe2(ends, O_CLOEXEC), 0);
        child_.emplace([&] {
            ::dup2(ends[0], 0);
            ::execl("/bin/bash", name.c_str(), "-c", "read x; :", "-f", argument, nullptr);
        });
        ::close(ends[0]);
        input_ = ends[1];
        const std::string line = "/proc/" + std::to_string(Pid()) + "/cmdline";
        EXPECT_TRUE(Eventually([&] { return ReadFile(line).starts_with(name); }));
    }
    ~NamedProcess() { ::close(input_); }

    // The signal that it died of, 0 for none.
    int End()
    {
        ::close(std::exchange(input_, -1));
        const int status = child_->Status();
        return WIFSIGNALED(status) ? WTERMSIG(status) : 0;
    }

    pid_t Pid() const { return child_->Pid(); }

  private:
    std::optional<OwnChild> child_;
    int input_ = -1;
};

}  // namespace test

#endif
