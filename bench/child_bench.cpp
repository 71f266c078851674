// Running a program from a small parent, and finding processes.
#include "children.h"

#include <csignal>
#include <cstdio>

namespace {

constexpr int kSleepers = 3;

uint64_t Pgrep()
{
    std::FILE *output = ::popen("exec pgrep -f 'sleep 314159'", "re");
    uint64_t count = 0;
    for (int pid; std::fscanf(output, "%d", &pid) == 1;)
        ++count;
    ::pclose(output);
    return count;
}

}  // namespace

int main(int argc, char **argv)
{
    bench::CompareChildren(1);

    pid_t sleepers[kSleepers];
    for (pid_t &pid : sleepers) {
        pid = ::fork();
        if (pid == 0) {
            ::execl("/bin/sleep", "sleep", "314159", nullptr);
            ::_exit(255);
        }
    }
    ::usleep(100000);
    const auto tavo = [] {
        return static_cast<uint64_t>(TLIBPs("sleep 314159", nullptr, 0));
    };
    if (std::system("command -v pgrep > /dev/null") == 0)
        bench::Compare("process_search", kSleepers, {{"tavo", tavo}, {"pgrep -f", Pgrep}});
    else
        bench::Compare("process_search", kSleepers, {{"tavo", tavo}});
    const int result = bench::Run(argc, argv);
    for (const pid_t pid : sleepers)
        ::kill(pid, SIGKILL);
    return result;
}
