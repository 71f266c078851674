// Runs a program and reads both its outputs as they arrive.
#include "support/running_program.h"

#include "support/test.h"

#include <poll.h>

namespace test {

std::ostream &operator<<(std::ostream &out, const Ran &ran)
{
    return out << "exit status " << ran.status << "\n" << ran.out << ran.err;
}

int ShellStatus(int wait_status)
{
    return WIFEXITED(wait_status) ? WEXITSTATUS(wait_status) : 128 + WTERMSIG(wait_status);
}

void BecomeProgram(const std::string &path, const Words &words)
{
    std::vector<char *> arguments = {const_cast<char *>(path.c_str() + path.rfind('/') + 1)};
    for (const std::string &word : words)
        arguments.push_back(const_cast<char *>(word.c_str()));
    arguments.push_back(nullptr);
    // A test that has put on another user's ids keeps root's to return to; the program gets no more than it was meant to.
    if (::setresgid(::getegid(), ::getegid(), ::getegid()) != 0 ||
        ::setresuid(::geteuid(), ::geteuid(), ::geteuid()) != 0)
        ::_exit(125);
    ::execv(path.c_str(), arguments.data());
    ::_exit(125);
}

RunningProgram::RunningProgram(const std::string &path, const Words &words, const std::string &input)
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
        BecomeProgram(path, words);
    }
    ::close(in[0]);
    ::close(out[1]);
    ::close(err[1]);
    out_ = out[0];
    err_ = err[0];
}

RunningProgram::~RunningProgram()
{
    if (pid_ <= 0)
        return;
    ::kill(pid_, SIGKILL);
    Wait();
}

Ran RunningProgram::Wait()
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

}  // namespace test
