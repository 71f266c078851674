// A program of the caller's, run as a shell would run it.
#include "frame/program_run.h"

#include "frame/failure.h"
#include "frame/text.h"

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <iostream>

#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tavoctl {
namespace {

volatile std::sig_atomic_t running = 0;  // the program's process

void PassOn(int signal)
{
    if (running > 0)
        ::kill(running, signal);
}

// While the program runs: a terminal's interrupt reaches it by itself, and a request to end is passed on, since the
// locks must not be released under a program that still works.
class Attended {
  public:
    Attended()
    {
        // A request that comes before the program is there waits for it.
        sigset_t requests;
        ::sigemptyset(&requests);
        for (std::size_t i = ignored; i < std::size(signals); ++i)
            ::sigaddset(&requests, signals[i]);
        ::sigprocmask(SIG_BLOCK, &requests, &mask_);
        struct sigaction ignore = {};
        ignore.sa_handler = SIG_IGN;
        struct sigaction pass = {};
        pass.sa_handler = PassOn;
        for (std::size_t i = 0; i < std::size(signals); ++i)
            ::sigaction(signals[i], i < ignored ? &ignore : &pass, &saved_[i]);
    }
    ~Attended()
    {
        for (std::size_t i = 0; i < std::size(signals); ++i)
            ::sigaction(signals[i], &saved_[i], nullptr);
        ::sigprocmask(SIG_SETMASK, &mask_, nullptr);
    }
    Attended(const Attended &) = delete;
    Attended &operator=(const Attended &) = delete;

    void To(pid_t pid)
    {
        running = pid;
        ::sigprocmask(SIG_SETMASK, &mask_, nullptr);
    }

    // The program finds its signals as this program did. Of the actions, only the ignored ones need it: a handler does
    // not outlive an exec.
    void Restore(posix_spawnattr_t &attributes) const
    {
        sigset_t defaults;
        ::sigemptyset(&defaults);
        for (std::size_t i = 0; i < ignored; ++i)
            if (saved_[i].sa_handler != SIG_IGN)
                ::sigaddset(&defaults, signals[i]);
        ::posix_spawnattr_setsigdefault(&attributes, &defaults);
        ::posix_spawnattr_setsigmask(&attributes, &mask_);
        ::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETSIGMASK);
    }

  private:
    static constexpr int signals[] = {SIGINT, SIGQUIT, SIGTERM, SIGHUP};
    static constexpr std::size_t ignored = 2;
    struct sigaction saved_[4] = {};
    sigset_t mask_;
};

}  // namespace

std::string FindProgram(const std::string &name)
{
    const auto absent = [&] {
        return Failure{
            .attempted = "run " + name, .reason = "there is no such program", .status = exit_no_such_program};
    };
    if (name.empty())
        throw absent();
    if (name.find('/') != std::string::npos)
        return std::filesystem::absolute(name).string();
    const char *path = std::getenv("PATH");
    for (const std::string &folder : Split(path ? path : "/usr/sbin:/usr/bin:/sbin:/bin", ':')) {
        const std::filesystem::path file = std::filesystem::absolute(folder.empty() ? "." : folder) / name;
        std::error_code ignored;
        if (std::filesystem::is_regular_file(file, ignored) && ::access(file.c_str(), X_OK) == 0)
            return file.string();
    }
    throw absent();
}

int RunInForeground(const std::vector<std::string> &words)
{
    const std::string program = FindProgram(words[0]);
    std::vector<char *> arguments;
    for (const std::string &word : words)
        arguments.push_back(const_cast<char *>(word.c_str()));
    arguments.push_back(nullptr);
    std::cout.flush();

    Attended attended;
    posix_spawnattr_t attributes;
    ::posix_spawnattr_init(&attributes);
    attended.Restore(attributes);
    pid_t pid = 0;
    // Asked beforehand, too: an emulator of single programs does not bring back why the child could not become it.
    int error = ::access(program.c_str(), X_OK) == 0 ? 0 : errno;
    if (!error)
        error = ::posix_spawn(&pid, program.c_str(), nullptr, &attributes, arguments.data(), environ);
    ::posix_spawnattr_destroy(&attributes);
    if (error)
        throw Failure{.attempted = "run " + words[0],
                      .reason = std::strerror(error),
                      .status = error == ENOENT ? exit_no_such_program : exit_cannot_execute};
    attended.To(pid);
    int status = 0;
    while (::waitpid(pid, &status, 0) < 0)
        if (errno != EINTR)
            throw Failure{.attempted = "wait for " + words[0], .reason = std::strerror(errno)};
    running = 0;
    return WIFEXITED(status) ? WEXITSTATUS(status) : exit_by_signal + WTERMSIG(status);
}

}  // namespace tavoctl
