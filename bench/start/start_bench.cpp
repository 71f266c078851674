// What starting a program costs that links the library, against one that links the C library and one that links the C++
// runtime too: the processor time of the process from its creation to its end. The programs stand beside this one.
// Needs nothing but the C++ library, so it runs on the appliance as well; its results have the form of the other benches.
// usage: start_bench [--benchmark_repetitions=N]    rounds; without, one short round
#include <charconv>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

struct Contender {
    const char *name;
    const char *program;
};

constexpr Contender kContenders[] = {{"tavo", "start_library"}, {"plain C", "start_plain"}, {"C++", "start_runtime"}};

std::string OwnFolder()
{
    char path[PATH_MAX];
    const ssize_t length = ::readlink("/proc/self/exe", path, sizeof path);
    const std::string_view whole(path, length > 0 ? static_cast<size_t>(length) : 0);
    return std::string(whole.substr(0, whole.rfind('/') + 1));
}

double Microseconds(const timeval &time)
{
    return static_cast<double>(time.tv_sec) * 1e6 + static_cast<double>(time.tv_usec);
}

double StartOnce(const std::string &program)
{
    char *const words[] = {const_cast<char *>(program.c_str()), nullptr};
    pid_t pid = -1;
    int status = -1;
    rusage used{};
    if (::posix_spawn(&pid, program.c_str(), nullptr, nullptr, words, environ) != 0 ||
        ::wait4(pid, &status, 0, &used) != pid || status != 0) {
        std::fprintf(stderr, "%s does not run\n", program.c_str());
        std::exit(1);
    }
    return Microseconds(used.ru_utime) + Microseconds(used.ru_stime);
}

}  // namespace

int main(int argc, char **argv)
{
    constexpr std::string_view kRounds = "--benchmark_repetitions=";
    int rounds = 1;
    int starts = 5;
    for (int i = 1; i < argc; ++i) {
        const std::string_view argument = argv[i];
        if (argument.starts_with(kRounds)) {
            std::from_chars(argument.data() + kRounds.size(), argument.data() + argument.size(), rounds);
            starts = 50;
        }
    }
    const std::string folder = OwnFolder();
    const char *separator = "";
    std::printf("{\"benchmarks\": [");
    for (int round = 0; round < rounds; ++round) {
        for (const Contender &contender : kContenders) {
            double sum = 0;
            for (int i = 0; i < starts; ++i)
                sum += StartOnce(folder + contender.program);
            std::printf("%s\n{\"name\": \"start/1/%s\", \"run_name\": \"start/1/%s\", \"run_type\": \"iteration\", "
                        "\"cpu_time\": %.1f, \"time_unit\": \"us\"}",
                        separator, contender.name, contender.name, sum / starts);
            separator = ",";
        }
    }
    std::printf("]}\n");
    return 0;
}
