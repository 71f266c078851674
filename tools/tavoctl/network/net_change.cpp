// A change of the network that is kept or given up as a whole.
#include "network/net_change.h"

#include "tavo_net.h"
#include "tavo_proc.h"

#include "frame/failure.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <ctime>
#include <iostream>

#include <fcntl.h>
#include <poll.h>
#include <sys/file.h>
#include <sys/prctl.h>
#include <sys/signalfd.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

namespace tavoctl {
namespace {

constexpr const char *pid_file = "/var/run/tavo-net-trial.pid";
constexpr int longest_change = 90;  // seconds: an old DHCP client to be killed, a new one to get a lease

enum Word : char { begun = 'b', keep = 'k', give_up = 'g', kept = 'K', put_back = 'P', failed = 'F', refused = 'R' };

constexpr char question[] = "try new settings";

std::int64_t Now()  // milliseconds, also while the machine sleeps
{
    timespec now = {};
    ::clock_gettime(CLOCK_BOOTTIME, &now);
    return std::int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000;
}

int Left(std::int64_t until)
{
    return static_cast<int>(std::clamp<std::int64_t>(until - Now(), 0, 1000000));
}

bool Say(int socket, Word word)
{
    return ::send(socket, &word, 1, MSG_NOSIGNAL) == 1;
}

// 0 at the end of the line.
char Hear(int socket)
{
    char word = 0;
    return ::recv(socket, &word, 1, 0) == 1 ? word : '\0';
}

bool IsGone(int socket)
{
    char word;
    return ::recv(socket, &word, 1, MSG_PEEK | MSG_DONTWAIT) == 0;
}

// Detaches from the terminal or connection of the command, and sets a name, so that the process can be killed by name.
int StandAlone()
{
    ::setsid();
    ::prctl(PR_SET_NAME, "net-trial");
    sigset_t signals;
    ::sigemptyset(&signals);
    for (const int number : {SIGUSR1, SIGTERM, SIGHUP, SIGINT})
        ::sigaddset(&signals, number);
    ::sigprocmask(SIG_BLOCK, &signals, nullptr);
    const int null = ::open("/dev/null", O_RDWR | O_CLOEXEC);
    for (int fd = 0; fd < 3; ++fd)
        ::dup2(null, fd);
    ::sigdelset(&signals, SIGHUP);
    ::sigdelset(&signals, SIGINT);
    return ::signalfd(-1, &signals, SFD_CLOEXEC);
}

// Returns whether the change is confirmed in time.
bool IsConfirmed(int command, int signals, int seconds)
{
    std::int64_t until = Now() + (seconds + longest_change) * 1000ll;
    bool is_made = false;
    pollfd ends[] = {{command, POLLIN, 0}, {signals, POLLIN, 0}};
    for (;;) {
        const int count = ::poll(ends, 2, Left(until));
        if (count < 0 && errno == EINTR)
            continue;
        if (count <= 0)
            return false;
        if (ends[1].revents) {
            signalfd_siginfo signal = {};
            return ::read(signals, &signal, sizeof signal) == sizeof signal && signal.ssi_signo == SIGUSR1;
        }
        switch (Hear(command)) {
        case keep:
            return true;
        case begun:
            is_made = true;
            until = Now() + seconds * 1000ll;
            break;
        case give_up:
            return false;
        default:
            // The command has died. A complete change can still be confirmed by another process, an incomplete one not.
            if (!is_made)
                return false;
            ends[0].fd = -1;
        }
    }
}

// Ends the time for confirming; returns true when a confirmation has just arrived.
bool IsTooLate(int pid_fd, int signals)
{
    (void)!::ftruncate(pid_fd, 0);
    pollfd end = {signals, POLLIN, 0};
    signalfd_siginfo signal = {};
    const bool confirmed = ::poll(&end, 1, 0) == 1 && ::read(signals, &signal, sizeof signal) == sizeof signal &&
                           signal.ssi_signo == SIGUSR1;
    return !confirmed;
}

// A program that the killed command left, or another one, may hold the lock of the network for a while.
bool Insist(int (*end)())
{
    const std::int64_t until = Now() + 2 * longest_change * 1000ll;
    while (end() != 0) {
        if (TLIBErrGet() != ERR_LOCK_FAILED || Left(until) == 0)
            return TLIBErrGet() == ERR_FILE_NOT_FOUND;  // another process was faster
        ::sleep(1);
    }
    return true;
}

[[noreturn]] void Guard(int pid_fd, int command, int seconds)
{
    const int signals = StandAlone();
    if (TAVONetCheckpointTake() != 0) {
        const int code = TLIBErrGet();
        Say(command, refused);
        (void)!::send(command, &code, sizeof code, MSG_NOSIGNAL);
        ::unlink(pid_file);
        ::_exit(1);
    }
    Say(command, begun);
    const bool confirmed = IsConfirmed(command, signals, seconds) || !IsTooLate(pid_fd, signals);
    if (!confirmed && IsGone(command))
        ::sleep(1);  // its last program may still be changing something
    const bool done = Insist(confirmed ? TAVONetCheckpointEnd : TAVONetCheckpointPutBack);
    ::unlink(pid_file);
    Say(command, !done ? failed : confirmed ? kept : put_back);
    ::_exit(0);
}

int OpenPidFile()
{
    const int fd = ::open(pid_file, O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0644);
    FailIf(fd < 0, std::string("write ") + pid_file, "it cannot be opened");
    struct stat held, named;
    if (::flock(fd, LOCK_EX | LOCK_NB) == 0 && ::fstat(fd, &held) == 0 && ::stat(pid_file, &named) == 0 &&
        held.st_ino == named.st_ino)
        return fd;
    ::close(fd);
    throw BusyFailure(question, "others are on trial",
                      "tavoctl net confirm keeps them; or wait until they are given up");
}

void WritePid(int fd, pid_t pid)
{
    const std::string text = std::to_string(pid) + "\n";
    FailIf(::ftruncate(fd, 0) != 0 || ::pwrite(fd, text.data(), text.size(), 0) != static_cast<ssize_t>(text.size()),
           std::string("write ") + pid_file, "the disk is full");
}

}  // namespace

NetChange::NetChange(int seconds) : seconds_(seconds)
{
    const int pid_fd = OpenPidFile();
    int line[2];
    FailIf(::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, line) != 0, question, "no socket can be created");
    const pid_t pid = ::fork();
    FailIf(pid < 0, question, "no process can be started");
    if (pid == 0) {
        ::close(line[0]);
        try {
            WritePid(pid_fd, ::getpid());
        } catch (const Failure &) {
            ::_exit(1);
        }
        Guard(pid_fd, line[1], seconds);  // keeps the pid file locked
    }
    ::close(line[1]);
    ::close(pid_fd);
    guardian_ = line[0];
    const char word = Hear(guardian_);
    if (word == begun)
        return;
    int code = 0;
    if (word == refused && ::recv(guardian_, &code, sizeof code, MSG_WAITALL) == sizeof code)
        TLIBErrSet(code);
    ::close(guardian_);
    throw LibraryFailure("note the old settings");
}

NetChange::~NetChange()
{
    if (guardian_ >= 0)
        ::close(guardian_);
}

void NetChange::Make(const std::optional<int64_t> &seconds, const std::function<void()> &change)
{
    NetChange trial(static_cast<int>(seconds.value_or(0)));
    try {
        change();
    } catch (Failure &failure) {
        failure.AddHint(trial.GiveUp() ? "the old settings are back" : "the old settings could not be put back");
        throw;
    }
    if (seconds)
        trial.Begin();
    else
        Say(trial.guardian_, keep);
    FailIf(!trial.IsKept(), "keep the new settings", "they were not confirmed, the old ones are back");
}

void NetChange::Begin()
{
    Say(guardian_, begun);
}

bool NetChange::GiveUp()
{
    Say(guardian_, give_up);
    return Hear(guardian_) == put_back;
}

bool NetChange::IsKept()
{
    const bool asks = seconds_ > 0 && ::isatty(STDIN_FILENO) && ::isatty(STDERR_FILENO);
    const std::int64_t until = Now() + seconds_ * 1000ll;
    if (asks)
        std::cerr << "Keep the new settings? The old ones come back in " << seconds_ << " s. [y/N] " << std::flush;
    pollfd ends[] = {{guardian_, POLLIN, 0}, {asks ? STDIN_FILENO : -1, POLLIN, 0}};
    while (Left(until) > 0) {
        if (::poll(ends, 2, Left(until)) <= 0)
            continue;
        if (ends[0].revents)
            break;
        std::string answer;
        std::getline(std::cin, answer);
        Say(guardian_, answer == "y" || answer == "Y" || answer == "yes" ? keep : give_up);
        break;
    }
    const char verdict = Hear(guardian_);
    if (asks && verdict != kept)
        std::cerr << "\n";
    FailIf(verdict == failed, seconds_ > 0 ? "put the old settings back" : "keep the new settings",
           "the library refuses", "tavoctl net show tells what is there now");
    return verdict == kept;
}

void NetChange::Confirm()
{
    FailIf(TLIBProcSignalByPidFile(pid_file, SIGUSR1) != 0, "keep the new settings", "none are on trial",
           "the old ones are back, or the new ones are confirmed already", exit_not_found);
    for (int i = 0; i < 500; ++i) {
        if (::access(pid_file, F_OK) != 0)
            return;
        ::usleep(10000);
    }
    throw Failure{.attempted = "keep the new settings", .reason = "they are just being put back"};
}

}  // namespace tavoctl
