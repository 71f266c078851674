// Runs tavoctl, as it is installed in the appliance root, and keeps what it said.
#ifndef TESTS_TOOLS_TAVOCTL_RUN_TAVOCTL_H
#define TESTS_TOOLS_TAVOCTL_RUN_TAVOCTL_H

#include "support/appliance_root.h"

#include <gtest/gtest.h>

#include <csignal>
#include <cstdlib>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

#include <fcntl.h>
#include <poll.h>
#include <sys/wait.h>
#include <unistd.h>

namespace test {

using Words = std::vector<std::string>;

struct Ran {
    int status;  // 128 and the signal for a death by one
    std::string out;
    std::string err;
};

inline std::ostream &operator<<(std::ostream &out, const Ran &ran)
{
    return out << "exit status " << ran.status << "\n" << ran.out << ran.err;
}

inline int ShellStatus(int status)
{
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

[[noreturn]] inline void BecomeTavoctl(const Words &words)
{
    std::vector<char *> arguments = {const_cast<char *>("tavoctl")};
    for (const std::string &word : words)
        arguments.push_back(const_cast<char *>(word.c_str()));
    arguments.push_back(nullptr);
    ::execv("/usr/bin/tavoctl", arguments.data());
    ::_exit(125);
}

// A tavoctl that is still running. Its outputs are pipes.
class RunningTavoctl {
  public:
    // It reads the input, which must fit into a pipe, as its standard input.
    explicit RunningTavoctl(const Words &words, const std::string &input = {})
    {
        int in[2];
        int out[2];
        int err[2];
        EXPECT_EQ(::pipe2(in, O_CLOEXEC), 0);
        EXPECT_EQ(::write(in[1], input.data(), input.size()), static_cast<ssize_t>(input.size()));
        ::close(in[1]);
        EXPECT_EQ(::pipe2(out, O_CLOEXEC), 0);
        EXPECT_EQ(::pipe2(err, O_CLOEXEC), 0);
        pid_ = ::fork();
        if (pid_ == 0) {
            ::dup2(in[0], 0);
            ::dup2(out[1], 1);
            ::dup2(err[1], 2);
            BecomeTavoctl(words);
        }
        ::close(in[0]);
        ::close(out[1]);
        ::close(err[1]);
        out_ = out[0];
        err_ = err[0];
    }
    ~RunningTavoctl()
    {
        if (pid_ > 0)
            Wait();
    }
    RunningTavoctl(const RunningTavoctl &) = delete;
    RunningTavoctl &operator=(const RunningTavoctl &) = delete;

    pid_t Pid() const { return pid_; }

    Ran Wait()
    {
        Ran ran = {};
        pollfd ends[] = {{out_, POLLIN, 0}, {err_, POLLIN, 0}};
        std::string *texts[] = {&ran.out, &ran.err};
        while (ends[0].fd >= 0 || ends[1].fd >= 0) {
            if (::poll(ends, 2, -1) < 0)
                continue;
            for (int i = 0; i < 2; ++i) {
                if (ends[i].fd < 0 || !ends[i].revents)
                    continue;
                char bytes[4096];
                const ssize_t count = ::read(ends[i].fd, bytes, sizeof bytes);
                if (count > 0)
                    texts[i]->append(bytes, static_cast<std::size_t>(count));
                else
                    ::close(std::exchange(ends[i].fd, -1));
            }
        }
        int status = 0;
        ::waitpid(std::exchange(pid_, -1), &status, 0);
        ran.status = ShellStatus(status);
        return ran;
    }

  private:
    pid_t pid_;
    int out_;
    int err_;
};

inline Ran Tavoctl(const Words &words, const std::string &input = {})
{
    return RunningTavoctl(words, input).Wait();
}

struct Answer {
    std::string prompt;  // once this is shown
    std::string typed;   // the person types that
};

// At a terminal; everything shown comes back as it was sent.
inline Ran TavoctlAtTerminal(const Words &words, const std::vector<Answer> &answers)
{
    const int master = ::posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
    EXPECT_GE(master, 0);
    EXPECT_EQ(::grantpt(master), 0);
    EXPECT_EQ(::unlockpt(master), 0);
    const std::string name = ::ptsname(master);
    const int terminal = ::open(name.c_str(), O_RDWR | O_NOCTTY | O_CLOEXEC);
    EXPECT_GE(terminal, 0) << name;
    const pid_t pid = ::fork();
    if (pid == 0) {
        for (int fd = 0; fd < 3; ++fd)
            ::dup2(terminal, fd);
        BecomeTavoctl(words);
    }
    ::close(terminal);
    Ran ran = {};
    std::size_t seen = 0;
    auto answer = answers.begin();
    char bytes[4096];
    do {
        if (answer != answers.end())
            if (const std::size_t at = ran.out.find(answer->prompt, seen); at != std::string::npos) {
                seen = at + answer->prompt.size();
                EXPECT_EQ(::write(master, answer->typed.data(), answer->typed.size()),
                          static_cast<ssize_t>(answer->typed.size()));
                ++answer;
            }
        const ssize_t count = ::read(master, bytes, sizeof bytes);
        if (count <= 0)
            break;
        ran.out.append(bytes, static_cast<std::size_t>(count));
    } while (true);
    ::close(master);
    int status = 0;
    ::waitpid(pid, &status, 0);
    ran.status = ShellStatus(status);
    return ran;
}

// What is typed is there before the program asks.
inline Ran TavoctlAtTerminal(const Words &words, const std::string &typed = {})
{
    return TavoctlAtTerminal(words, {{"", typed}});
}

}  // namespace test

#endif
