// One program that the host wants run, with its limits, in a control group of its own.
#include "job.h"

#include "fresh_root.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <system_error>

#include <fcntl.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/resource.h>
#include <sys/signalfd.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace machine {
namespace {

const std::string group = "/sys/fs/cgroup/job";

void Write(const std::string &path, const std::string &text)
{
    std::ofstream(path) << text;
}

int Counted(const std::string &path, const std::string &name)
{
    std::ifstream file(path);
    std::string word;
    int value = 0;
    while (file >> word >> value)
        if (word == name)
            return value;
    return 0;
}

int ProcessesIn(const std::string &path)
{
    std::ifstream file(path + "/cgroup.procs");
    int count = 0;
    for (std::string line; std::getline(file, line);)
        ++count;
    return count;
}

void OpenConsole(const std::string &size)
{
    const int console = open("/dev/ttyAMA0", O_RDWR);
    ioctl(console, TIOCSCTTY, 0);
    winsize window{};
    if (sscanf(size.c_str(), "%hu %hu", &window.ws_row, &window.ws_col) == 2)
        ioctl(console, TIOCSWINSZ, &window);
    for (int target : {0, 1, 2})
        dup2(console, target);
}

[[noreturn]] void BecomeJob(const Job &job, int out, int err)
{
    try {
        sigset_t none;
        sigemptyset(&none);
        sigprocmask(SIG_SETMASK, &none, nullptr);
        setsid();
        Write(group + "/cgroup.procs", "0");
        if (job.terminal.empty()) {
            dup2(open("/dev/null", O_RDONLY | O_CLOEXEC), 0);
            dup2(out, 1);
            dup2(err, 2);
        } else {
            OpenConsole(job.terminal);
        }
        const rlimit no_core{0, 0};
        setrlimit(RLIMIT_CORE, &no_core);
        if (job.fresh)
            EnterFreshRoot(job.layer, job.host_at);
        if (chdir(job.directory.c_str()) != 0)
            throw std::system_error(errno, std::generic_category(), job.directory);
        for (const std::string &variable : job.environment)
            putenv(const_cast<char *>(variable.c_str()));
        std::vector<char *> argv;
        for (const std::string &argument : job.arguments)
            argv.push_back(const_cast<char *>(argument.c_str()));
        argv.push_back(nullptr);
        execvp(argv[0], argv.data());
        const int error = errno;
        dprintf(2, "%s: %s\n", argv[0], strerror(error));
        _exit(error == ENOENT ? 127 : 126);  // as a shell does
    } catch (const std::exception &problem) {
        dprintf(2, "appliance: %s\n", problem.what());
        _exit(126);
    }
}

// Passes on what there is to read. False at the end.
bool Relay(int pipe, char type, const Channel &host)
{
    static char buffer[65536];
    const ssize_t got = read(pipe, buffer, sizeof buffer);
    if (got > 0)
        host.Send(type, {buffer, static_cast<size_t>(got)});
    return got > 0 || (got < 0 && errno == EINTR);
}

std::string FirstLine(const std::string &path)
{
    std::ifstream file(path);
    std::string line;
    std::getline(file, line);
    return line;
}

// One line about each process of the job: what hangs is easier to find with the place where the kernel holds it.
std::string Processes()
{
    std::ifstream file(group + "/cgroup.procs");
    std::string text;
    for (std::string id; std::getline(file, id);) {
        const std::string process = "/proc/" + id;
        text += "process " + id + " " + FirstLine(process + "/comm") + ": waits in " + FirstLine(process + "/wchan") +
                ", system call " + FirstLine(process + "/syscall") + "\n";
    }
    return text;
}

// Ends every process of the job and waits for all of them.
void EndGroup()
{
    Write(group + "/cgroup.kill", "1");
    for (int tries = 0; rmdir(group.c_str()) != 0 && tries < 2000; ++tries) {
        while (waitpid(-1, nullptr, WNOHANG) > 0) {
        }
        usleep(1000);
    }
}

}  // namespace

Job ParseJob(std::string_view payload)
{
    Job job;
    bool options = true;
    while (!payload.empty()) {
        const size_t end = payload.find('\0');
        const std::string word(payload.substr(0, end));
        payload.remove_prefix(end == payload.npos ? payload.size() : end + 1);
        if (!options) {
            job.arguments.push_back(word);
            continue;
        }
        const size_t equals = word.find('=');
        const std::string name = word.substr(0, equals);
        const std::string value = equals == word.npos ? "" : word.substr(equals + 1);
        if (name == "--")
            options = false;
        else if (name == "env")
            job.environment.push_back(value);
        else if (name == "directory")
            job.directory = value;
        else if (name == "memory")
            job.memory = atoll(value.c_str());
        else if (name == "fresh")
            job.fresh = true;
        else if (name == "layer")
            job.layer = value;
        else if (name == "host_at")
            job.host_at = value;
        else if (name == "terminal")
            job.terminal = value;
    }
    return job;
}

Outcome RunJob(const Job &job, const Channel &host)
{
    mkdir(group.c_str(), 0755);
    if (job.memory > 0)
        Write(group + "/memory.max", std::to_string(job.memory));

    int out[2], err[2];
    if (pipe2(out, O_CLOEXEC) != 0 || pipe2(err, O_CLOEXEC) != 0)
        throw std::system_error(errno, std::generic_category(), "pipe");
    const pid_t program = fork();
    if (program == 0)
        BecomeJob(job, out[1], err[1]);
    close(out[1]);
    close(err[1]);

    Outcome outcome;
    sigset_t child_signal;
    sigemptyset(&child_signal);
    sigaddset(&child_signal, SIGCHLD);
    enum { kOut, kErr, kChild, kHost };
    pollfd waited[] = {{out[0], POLLIN, 0},
                       {err[0], POLLIN, 0},
                       {signalfd(-1, &child_signal, SFD_CLOEXEC | SFD_NONBLOCK), POLLIN, 0},
                       {host.Descriptor(), POLLIN, 0}};
    for (bool running = true; running || waited[kOut].fd >= 0 || waited[kErr].fd >= 0;) {
        poll(waited, std::size(waited), -1);
        if (waited[kOut].revents && !Relay(out[0], 'o', host))
            waited[kOut].fd = -1;
        if (waited[kErr].revents && !Relay(err[0], 'e', host))
            waited[kErr].fd = -1;
        if (waited[kHost].revents & POLLIN && host.Receive().type == 'K') {
            host.Send('e', Processes());
            Write(group + "/cgroup.kill", "1");
        }
        signalfd_siginfo ignored;
        while (read(waited[kChild].fd, &ignored, sizeof ignored) > 0) {
        }
        // Orphans of the job come to the agent: they are waited for, so that none of them stays as a zombie.
        int status;
        for (pid_t ended; (ended = waitpid(-1, &status, WNOHANG)) > 0;) {
            if (ended != program)
                continue;
            running = false;
            outcome.status = status;
            outcome.left_behind = ProcessesIn(group);
            Write(group + "/cgroup.kill", "1");
        }
    }
    close(out[0]);
    close(err[0]);
    close(waited[kChild].fd);
    outcome.killed_for_memory = Counted(group + "/memory.events", "oom_kill");
    EndGroup();
    return outcome;
}

}  // namespace machine
