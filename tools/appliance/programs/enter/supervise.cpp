// Waits for the command, hands signals on to it, and ends as it ended.
#include "enter.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include <dirent.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace enter {
namespace {

sigset_t Watched()
{
    sigset_t set;
    sigemptyset(&set);
    for (const int number : {SIGCHLD, SIGTERM, SIGINT, SIGHUP, SIGQUIT, SIGUSR1, SIGUSR2, SIGALRM})
        sigaddset(&set, number);
    return set;
}

pid_t ParentOf(pid_t pid)
{
    char path[64];
    std::snprintf(path, sizeof path, "/proc/%d/stat", static_cast<int>(pid));
    std::FILE *file = std::fopen(path, "re");
    if (!file)
        return 0;
    char text[512];
    text[std::fread(text, 1, sizeof text - 1, file)] = '\0';
    std::fclose(file);
    const char *end_of_name = std::strrchr(text, ')');
    int parent = 0;
    if (end_of_name)
        static_cast<void>(std::sscanf(end_of_name + 1, " %*c %d", &parent));
    return parent;
}

}  // namespace

// The mask of the caller is not kept: a command starts with no signal blocked, whatever the test driver did.
void BlockSignals()
{
    const sigset_t set = Watched();
    sigprocmask(SIG_SETMASK, &set, nullptr);
}

void UnblockSignals()
{
    for (int number = 1; number < NSIG; ++number)
        ::signal(number, SIG_DFL);
    sigset_t none;
    sigemptyset(&none);
    sigprocmask(SIG_SETMASK, &none, nullptr);
}

int WaitFor(pid_t command, bool from_outside_only)
{
    const sigset_t set = Watched();
    for (;;) {
        int status;
        for (pid_t ended; (ended = ::waitpid(-1, &status, WNOHANG)) > 0;) {
            if (ended == command)
                return status;
        }
        siginfo_t info;
        const int number = ::sigwaitinfo(&set, &info);
        // The terminal sends to the whole foreground group, the command included.
        const bool sent = info.si_code == SI_USER || info.si_code == SI_TKILL || info.si_code == SI_QUEUE;
        if (number > 0 && number != SIGCHLD && sent && (!from_outside_only || info.si_pid == 0))
            ::kill(command, number);
    }
}

void KillLeftovers()
{
    for (bool found = true; found;) {
        found = false;
        DIR *processes = ::opendir("/proc");
        if (!processes)
            return;
        while (const dirent *entry = ::readdir(processes)) {
            const pid_t pid = static_cast<pid_t>(std::atoi(entry->d_name));
            if (pid > 1 && ParentOf(pid) == ::getpid()) {
                ::kill(pid, SIGKILL);
                while (::waitpid(pid, nullptr, 0) < 0 && errno == EINTR) {
                }
                found = true;  // its children are ours now
            }
        }
        ::closedir(processes);
    }
}

void EndAs(int wait_status)
{
    if (WIFEXITED(wait_status))
        std::exit(WEXITSTATUS(wait_status));
    const int number = WTERMSIG(wait_status);
    const rlimit no_core = {0, 0};
    ::setrlimit(RLIMIT_CORE, &no_core);
    UnblockSignals();
    ::raise(number);
    std::exit(128 + number);
}

}  // namespace enter
