// findhostd: answers the discovery queries of other appliances and lists who answers ours.
//
// Two processes: one listens to the network and has no rights, one writes the list and never hears the network.
#include "tavo_file.h"

#include "network_part.h"
#include "root_part.h"
#include "standard_descriptors.h"

#include <cerrno>
#include <charconv>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <string>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/prctl.h>
#include <sys/signalfd.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <syslog.h>
#include <unistd.h>

namespace {

constexpr const char *kPidFile = "/var/run/findhostd.pid";

int Complain(const char *what)
{
    std::fprintf(stderr, "findhostd: %s: %s\n", what, std::strerror(errno));
    return 1;
}

// The number of this model; 1 where the factory gave none.
uint32_t ModelNumber()
{
    char text[16] = "";
    uint32_t model = 0;
    if (TLIBFileGetKeyValue("/etc.defaults/tavoinfo.conf", "modelnumber", text, sizeof text, 0) > 0)
        std::from_chars(text, text + std::strlen(text), model);
    return model ? model : 1;
}

// A caller may have closed its standard streams: files opened later must not become one of them.
void HaveStandardStreams()
{
    int fd;
    do
        fd = ::open("/dev/null", O_RDWR);
    while (fd >= 0 && fd < 3);
    if (fd >= 3)
        ::close(fd);
}

// The pid file, locked while the daemon runs; -1 with errno, EWOULDBLOCK when another process holds it.
int OpenPidFile()
{
    const int fd = ::open(kPidFile, O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK, 0644);
    if (fd >= 0 && ::flock(fd, LOCK_EX | LOCK_NB) == 0)
        return fd;
    const int error = errno;
    if (fd >= 0)
        ::close(fd);
    errno = error;
    return -1;
}

bool WritePid(int fd)
{
    const std::string text = std::to_string(::getpid()) + "\n";
    return ::ftruncate(fd, 0) == 0 && ::pwrite(fd, text.data(), text.size(), 0) == static_cast<ssize_t>(text.size());
}

// A session of its own; the caller ends when the daemon is ready, with its verdict. Gives the descriptor that tells it.
int Detach()
{
    int ready[2];
    if (::pipe2(ready, O_CLOEXEC) != 0)
        return -1;
    const pid_t pid = ::fork();
    if (pid < 0)
        return -1;
    if (pid > 0) {
        ::close(ready[1]);
        char verdict = 1;
        ::_exit(::read(ready[0], &verdict, 1) == 1 ? verdict : 1);
    }
    ::close(ready[0]);
    ::setsid();
    return ready[1];
}

int OpenNull()
{
    return ::open("/dev/null", O_RDWR | O_CLOEXEC);
}

// The caller's end with his program; who reads from this one would wait for ever.
void LeaveStandardStreams(int null)
{
    for (int fd = 0; fd < 3; ++fd)
        ::dup2(null, fd);
    ::close(null);
}

[[noreturn]] void BecomeNetworkPart(pid_t root_part, int network, int reports, int report_ready)
{
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    sigset_t none;
    ::sigemptyset(&none);
    ::sigprocmask(SIG_SETMASK, &none, nullptr);
    const uint32_t model = ModelNumber();
    const char done = 0;
    const int null = OpenNull();
    if (!findhostd::DropPrivileges() || ::prctl(PR_SET_PDEATHSIG, SIGKILL) != 0 || ::getppid() != root_part) {
        Complain("cannot give up the rights of root");
        ::_exit(1);
    }
    LeaveStandardStreams(null);
    if (::write(report_ready, &done, 1) != 1)
        ::_exit(1);
    ::close(report_ready);
    findhostd::ListenToNetwork(network, reports, model);
    ::_exit(0);
}

int Serve(int verdict)
{
    int pid_file = OpenPidFile();
    const bool locked = pid_file < 0 && errno == EWOULDBLOCK;
    if (pid_file < 0 && !locked)
        return Complain(kPidFile);
    const int network = findhostd::OpenNetworkSocket();
    if (network < 0 && locked) {
        std::fprintf(stderr, "findhostd: it runs already\n");
        return 1;
    }
    if (network < 0)
        return Complain("cannot listen on UDP port 9999");
    // No process listens, so the lock is not held by a daemon but by a program that may read the file.
    if (locked && (::unlink(kPidFile) != 0 || (pid_file = OpenPidFile()) < 0))
        return Complain(kPidFile);

    sigset_t asked;
    ::sigemptyset(&asked);
    for (const int signal : {SIGTERM, SIGINT, SIGHUP})
        ::sigaddset(&asked, signal);
    ::sigprocmask(SIG_BLOCK, &asked, nullptr);
    int reports[2];
    int ready[2];
    if (::socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, reports) != 0 || ::pipe2(ready, O_CLOEXEC) != 0)
        return Complain("cannot reach the network part");
    const pid_t root_part = ::getpid();
    const pid_t listener = ::fork();
    if (listener < 0)
        return Complain("cannot start the network part");
    if (listener == 0) {
        for (const int fd : {pid_file, reports[0], ready[0], verdict})
            ::close(fd);
        BecomeNetworkPart(root_part, network, reports[1], ready[1]);
    }
    for (const int fd : {network, reports[1], ready[1]})
        ::close(fd);

    char done = 1;
    if (::read(ready[0], &done, 1) != 1 || !WritePid(pid_file)) {
        ::kill(listener, SIGKILL);
        ::waitpid(listener, nullptr, 0);
        return 1;
    }
    if (verdict >= 0) {
        LeaveStandardStreams(OpenNull());
        if (::write(verdict, &done, 1) != 1)
            ::syslog(LOG_WARNING, "the starting program no longer waits for the daemon");
        ::close(verdict);
    }
    const bool ended = findhostd::KeepList(reports[0], ::signalfd(-1, &asked, SFD_CLOEXEC | SFD_NONBLOCK));
    ::unlink(kPidFile);
    ::kill(listener, SIGKILL);
    ::waitpid(listener, nullptr, 0);
    if (!ended)
        ::syslog(LOG_ERR, "the network part has ended");
    return ended ? 0 : 1;
}

}  // namespace

int main(int argc, char **argv)
{
    FillStandardDescriptors();
    const bool foreground = argc == 2 && std::strcmp(argv[1], "--foreground") == 0;
    if (argc > 1 && !foreground) {
        std::fprintf(stderr,
                     "usage: findhostd [--foreground]\n"
                     "Answers the discovery queries of other appliances on UDP port 9999 and lists who answers\n"
                     "ours in /tmp/tavods.list.\n");
        return 2;
    }
    HaveStandardStreams();
    ::umask(022);
    ::openlog("findhostd", LOG_PID, LOG_DAEMON);
    const int verdict = foreground ? -1 : Detach();
    if (!foreground && verdict < 0)
        return Complain("cannot start");
    return Serve(verdict);
}
