// Stands in for every daemon of the appliance: the name it is called by says which one it is.
// usage: NAME [--pid-file FILE] [--kernel-thread]
// It goes to the background, writes its pid file, logs what it is sent and ends on SIGTERM. /var/standin/NAME.mode
// makes it misbehave (words, any number): dies, late, stubborn, nopid, garbage, stale.
#include <algorithm>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include <fcntl.h>
#include <linux/prctl.h>
#include <sys/prctl.h>
#include <unistd.h>

namespace {

const std::string folder = "/var/standin/";

std::vector<std::string> ReadMode(const std::string &name)
{
    std::vector<std::string> words;
    if (std::FILE *file = std::fopen((folder + name + ".mode").c_str(), "re")) {
        char word[64];
        while (std::fscanf(file, "%63s", word) == 1)
            words.emplace_back(word);
        std::fclose(file);
    }
    return words;
}

void Log(const std::string &name, const std::string &event)
{
    const std::string line = event + "\n";
    const int file = ::open((folder + name + ".log").c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644);
    if (file < 0 || ::write(file, line.data(), line.size()) < 0)
        std::perror("standin: log");
    ::close(file);
}

void Write(const std::string &path, const std::string &text)
{
    const int file = ::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
    if (file < 0 || ::write(file, text.data(), text.size()) < 0)
        std::perror("standin: pid file");
    ::close(file);
}

// A kernel thread has a name and no arguments. A process can come to look like one by pointing at an empty range.
void LoseArguments()
{
    prctl_mm_map map = {};
    std::FILE *file = std::fopen("/proc/self/stat", "re");
    if (!file)
        return;
    char text[2048];
    text[std::fread(text, 1, sizeof text - 1, file)] = '\0';
    std::fclose(file);
    const char *fields = std::strrchr(text, ')') + 2;
    unsigned long long value[50] = {};
    size_t count = 3;  // the field numbers of the manual page, from 1; "fields" starts at the third
    for (char *save = nullptr, *word = ::strtok_r(const_cast<char *>(fields), " ", &save); word && count < 50;
         word = ::strtok_r(nullptr, " ", &save))
        std::sscanf(word, "%llu", &value[count++]);
    map.start_code = value[26];
    map.end_code = value[27];
    map.start_stack = value[28];
    map.start_data = value[45];
    map.end_data = value[46];
    map.start_brk = value[47];
    map.brk = reinterpret_cast<unsigned long>(::sbrk(0));
    map.arg_start = map.arg_end = value[48];
    map.env_start = map.env_end = value[48];
    map.exe_fd = ~0U;
    if (::prctl(PR_SET_MM, PR_SET_MM_MAP, &map, sizeof map, 0) != 0)
        std::perror("standin: kernel thread");
}

// Goes on in a process of its own. The first one ends when that closes its descriptors: who starts a daemon sees its
// pid file, unless it is a late one.
void Detach()
{
    int ready[2];
    if (::pipe2(ready, 0) != 0)
        std::exit(1);
    if (::fork() != 0) {
        char byte;
        ::close(ready[1]);
        static_cast<void>(::read(ready[0], &byte, 1) == 0);
        std::exit(0);
    }
    ::setsid();
}

void CloseDescriptors()
{
    const int null = ::open("/dev/null", O_RDWR);
    for (int i = 0; i < 3; ++i)
        ::dup2(null, i);
    ::close_range(3, ~0U, 0);
}

// Logs signals until SIGTERM.
void LogSignals(const std::string &name, const sigset_t &all, bool stubborn)
{
    for (;;) {
        int number = 0;
        if (sigwait(&all, &number) != 0)
            continue;
        Log(name, "signal " + std::to_string(number));
        if (number == SIGTERM && !stubborn)
            return;
    }
}

}  // namespace

int main(int argc, char **argv)
{
    const char *slash = std::strrchr(argv[0], '/');
    const std::string name = slash ? slash + 1 : argv[0];
    std::string pid_file;
    bool kernel_thread = false;
    for (int i = 1; i < argc; ++i) {
        if (std::strcmp(argv[i], "--pid-file") == 0 && i + 1 < argc)
            pid_file = argv[++i];
        else if (std::strcmp(argv[i], "--kernel-thread") == 0)
            kernel_thread = true;
    }
    const std::vector<std::string> words = ReadMode(name);
    const auto has = [&](const char *word) {
        return std::find(words.begin(), words.end(), word) != words.end();
    };

    if (has("dies")) {
        Log(name, "dies");
        return 1;
    }
    sigset_t all;
    sigfillset(&all);
    sigprocmask(SIG_SETMASK, &all, nullptr);
    Detach();
    const std::string own = std::to_string(::getpid());
    Log(name, "start " + own);
    Write(folder + name + ".pid", own + "\n");
    const auto write_pid_file = [&] {
        if (!pid_file.empty() && !has("nopid"))
            Write(pid_file, has("garbage") ? "not a number\n" : has("stale") ? "999999\n" : own + "\n");
    };
    if (kernel_thread)
        LoseArguments();
    if (!has("late"))
        write_pid_file();
    CloseDescriptors();
    if (has("late")) {
        ::usleep(1500000);
        write_pid_file();
    }
    LogSignals(name, all, has("stubborn"));
    if (!pid_file.empty())
        ::unlink(pid_file.c_str());
    ::unlink((folder + name + ".pid").c_str());
    Log(name, "end");
    return 0;
}
