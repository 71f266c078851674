// The usual form: private user, mount, pid, network, host-name and ipc namespaces.
#include "enter.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>

#include <fcntl.h>
#include <grp.h>
#include <net/if.h>
#include <sched.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

namespace enter {
namespace {

constexpr int exit_no_namespaces = 124;  // of the inner process: before anything of the request was looked at
constexpr unsigned long namespaces = CLONE_NEWNS | CLONE_NEWPID | CLONE_NEWNET | CLONE_NEWUTS | CLONE_NEWIPC;
constexpr char size_limit[] = "size=512m";  // a test that fills its disk must not fill the machine's memory

// What the one inside tells the one outside, in this order; the pipe ends early when entering failed.
struct Report {
    int entered;
    int status;
};

bool WriteAll(const std::string &path, const std::string &text)
{
    const int file = ::open(path.c_str(), O_WRONLY | O_CLOEXEC);
    const bool done = file >= 0 && ::write(file, text.data(), text.size()) == static_cast<ssize_t>(text.size());
    ::close(file);
    return done;
}

// Root keeps every user id that it has itself; any other user becomes the only user inside.
std::string MapOf(const char *file, unsigned own)
{
    if (::geteuid() != 0)
        return "0 " + std::to_string(own) + " 1\n";
    std::FILE *map = std::fopen(file, "re");
    Must(map, "read", file);
    std::string text;
    unsigned inside, outside, count;
    while (std::fscanf(map, "%u %u %u", &inside, &outside, &count) == 3)
        text += std::to_string(inside) + " " + std::to_string(inside) + " " + std::to_string(count) + "\n";
    std::fclose(map);
    return text;
}

bool MapIds(pid_t inner)
{
    const std::string process = "/proc/" + std::to_string(inner);
    if (::geteuid() != 0)
        WriteAll(process + "/setgroups", "deny");
    return WriteAll(process + "/uid_map", MapOf("/proc/self/uid_map", ::geteuid())) &&
           WriteAll(process + "/gid_map", MapOf("/proc/self/gid_map", ::getegid()));
}

void Mount(const char *what, const std::string &where, const char *type, unsigned long flags, const char *data)
{
    if (::mount(what, where.c_str(), type, flags, data) != 0)
        Die("cannot mount %s on %s: %s", what, where.c_str(), std::strerror(errno));
}

void MountOrRefuse(const char *type, const std::string &where, unsigned long flags, const char *data)
{
    if (::mount(type, where.c_str(), type, flags, data) != 0)
        ::_exit(exit_no_namespaces);
}

void BindMount(const std::string &from, const std::string &to, bool writable)
{
    // Where something is mounted below, only the whole of it may be bound from a namespace of less privilege.
    if (::mount(from.c_str(), to.c_str(), nullptr, MS_BIND, nullptr) != 0)
        Mount(from.c_str(), to, nullptr, MS_BIND | MS_REC, nullptr);
    if (writable)
        return;
    struct statvfs facts;
    Must(::statvfs(to.c_str(), &facts) == 0, "look at", to);
    unsigned long flags = MS_REMOUNT | MS_BIND | MS_RDONLY;
    const auto keep = [&](unsigned long fact, unsigned long flag) {
        flags |= facts.f_flag & fact ? flag : 0;
    };
    keep(ST_NOSUID, MS_NOSUID);
    keep(ST_NODEV, MS_NODEV);
    keep(ST_NOEXEC, MS_NOEXEC);
    keep(ST_NOATIME, MS_NOATIME);
    keep(ST_NODIRATIME, MS_NODIRATIME);
    keep(ST_RELATIME, MS_RELATIME);
    Mount(from.c_str(), to, nullptr, flags, nullptr);
}

void MakeDevices(const std::string &place)
{
    const std::string dev = place + "/dev";
    for (const char *name : {"null", "zero", "full", "random", "urandom", "tty"}) {
        const std::string outer = std::string("/dev/") + name;
        if (::access(outer.c_str(), F_OK) != 0)
            continue;
        const std::string inner = dev + "/" + name;
        MakePlaceFor(outer, inner);
        BindMount(outer, inner, true);
    }
    Mount("devpts", dev + "/pts", "devpts", MS_NOSUID | MS_NOEXEC, "newinstance,ptmxmode=0666,mode=620");
    Mount("tmpfs", dev + "/shm", "tmpfs", MS_NOSUID | MS_NODEV, size_limit);
}

void RaiseLoopback()
{
    const int control = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    ifreq request = {};
    std::strcpy(request.ifr_name, "lo");
    request.ifr_flags = IFF_UP | IFF_RUNNING;
    Must(::ioctl(control, SIOCSIFFLAGS, &request) == 0, "raise", "lo");
    ::close(control);
}

// A user namespace has its own table of program formats in recent kernels. The emulator is opened here and now.
bool RegisterEmulator(const std::string &place, const std::string &emulator)
{
    const std::string table = place + "/proc/sys/fs/binfmt_misc";
    if (::mount("binfmt_misc", table.c_str(), "binfmt_misc", 0, nullptr) != 0)
        return false;
    std::string rule = R"(:arm:M::\x7fELF\x01\x01\x01\x00\x00\x00\x00\x00\x00\x00\x00\x00\x02\x00\x28\x00:)"
                       R"(\xff\xff\xff\xff\xff\xff\xff\x00\xff\xff\xff\xff\xff\xff\xff\xff\xfe\xff\xff\xff:)";
    rule += emulator + ":FC";
    return WriteAll(table + "/register", rule);
}

// A directory on a file system of its own; where the copy is kept, at least a mount of its own.
void MakeOwnMount(const Entry &entry, const std::string &kept, const std::string &place)
{
    const std::string inner = place + "/" + entry.path;
    if (kept.empty()) {
        MakePlaceFor(place, inner);
        Mount("tmpfs", inner, "tmpfs", MS_NODEV, size_limit);
        return;
    }
    MakeParents(kept, "/" + entry.path);
    MakePlaceFor(kept, kept + "/" + entry.path);
    Mount((kept + "/" + entry.path).c_str(), inner, nullptr, MS_BIND, nullptr);
}

void FillPlace(const Request &request, const std::string &kept, const std::string &place)
{
    const std::string tree = request.root + "/tree";
    for (const Entry &entry : request.entries) {
        if (entry.kind == 't')
            MakeOwnMount(entry, kept, place);
        MakeEntry(entry, tree, place);
        if (entry.kind == 'r')
            BindMount(tree + "/" + entry.path, place + "/" + entry.path, false);
    }
}

// The private copy with everything that is mounted in it. Adds what is lacking to the list.
void BuildPlace(const Request &request, const std::string &kept, const std::string &place, std::string *lacks)
{
    // A machine may allow namespaces and still refuse these two; tried here, where the other form is still possible.
    MountOrRefuse("proc", place, MS_NOSUID | MS_NODEV | MS_NOEXEC, nullptr);
    MountOrRefuse("tmpfs", place, MS_NODEV, (std::string(size_limit) + ",mode=755").c_str());
    if (!kept.empty())
        Mount(kept.c_str(), place, nullptr, MS_BIND, nullptr);
    FillPlace(request, kept, place);
    Mount("proc", place + "/proc", "proc", MS_NOSUID | MS_NODEV | MS_NOEXEC, nullptr);
    if (::mount("sysfs", (place + "/sys").c_str(), "sysfs", MS_RDONLY | MS_NOSUID | MS_NODEV | MS_NOEXEC, nullptr) != 0)
        *lacks += ",sys";
    MakeDevices(place);
    for (const Bind &bind : request.binds) {
        MakeParents(place, bind.to);
        MakePlaceFor(bind.from, place + bind.to);
        BindMount(bind.from, place + bind.to, bind.writable);
    }
}

// Returns whether the command must be started through the emulator, because the kernel does not do so by itself.
bool BringEmulator(const Request &request, bool own_users, const std::string &place, std::string *lacks)
{
    if (request.emulator.empty())
        return false;
    const std::string inner = place + "/run/emulator";
    MakePlaceFor(request.emulator, inner);
    BindMount(request.emulator, inner, false);
    *lacks += ",setns";  // the emulator has threads, and only a process without them may change its mounts
    if (own_users && RegisterEmulator(place, request.emulator))
        return false;
    *lacks += ",foreign-exec";
    return true;
}

void MoveInto(const std::string &place)
{
    Must(::chdir(place.c_str()) == 0 && ::syscall(SYS_pivot_root, ".", ".") == 0, "move to", place);
    Must(::umount2(".", MNT_DETACH) == 0 && ::chdir("/") == 0, "leave", "the old root");
    Must(::sethostname("tavo", 4) == 0, "set", "the host name");
    RaiseLoopback();
}

bool AreFewIdsMapped()
{
    std::FILE *map = std::fopen("/proc/self/uid_map", "re");
    unsigned count = 0;
    const bool few = map && std::fscanf(map, "%*u %*u %u", &count) == 1 && count < 65535;
    if (map)
        std::fclose(map);
    return few;
}

// A search for a process by its command line must not find this process, whose command line names all of them.
void LoseArguments(const Request &request)
{
    std::memset(request.arguments, 0, request.arguments_size);
    std::strncpy(request.arguments, "init", request.arguments_size);
    ::prctl(PR_SET_NAME, "init", 0, 0, 0);
}

// Process 1 of the new namespaces: makes the place, moves in, runs the command, reports.
[[noreturn]] void Inside(const Request &request, bool own_users, const std::string &kept, int report)
{
    if (own_users) {
        ::setgroups(0, nullptr);
        Must(::setresgid(0, 0, 0) == 0 && ::setresuid(0, 0, 0) == 0, "become", "root");
    }
    ::prctl(PR_SET_PDEATHSIG, SIGKILL, 0, 0, 0);
    MountOrRefuse(nullptr, "/", MS_REC | MS_PRIVATE, nullptr);
    const std::string place = request.root + "/mnt";
    std::string lacks = "mknod";
    BuildPlace(request, kept, place, &lacks);
    const bool emulate = BringEmulator(request, own_users, place, &lacks);
    if (!own_users) {
        lacks += ",user";
        const std::string settings = place + "/proc/sys";
        BindMount(settings, settings, false);
        DropCapabilities(false);
    }
    MoveInto(place);
    if (AreFewIdsMapped())
        lacks += ",uids";
    LoseArguments(request);

    const pid_t command = ::fork();
    Must(command >= 0, "start", request.command[0]);
    if (command == 0) {
        ::close_range(3, ~0U, 0);
        RunCommand(request, "namespaces", lacks, emulate);
    }
    Report result = {1, 0};
    static_cast<void>(::write(report, &result.entered, sizeof result.entered));
    result.status = WaitFor(command, true);
    static_cast<void>(::write(report, &result.status, sizeof result.status));
    ::_exit(0);  // and the kernel kills whatever is left
}

pid_t CloneInto(unsigned long flags)
{
    return static_cast<pid_t>(::syscall(SYS_clone, flags | SIGCHLD, nullptr, nullptr, nullptr, nullptr));
}

}  // namespace

int EnterNamespaces(const Request &request, std::string *why)
{
    int go[2], report[2];
    Must(::pipe2(go, O_CLOEXEC) == 0 && ::pipe2(report, O_CLOEXEC) == 0, "make", "a pipe");
    const std::string kept = request.keep ? MakeRunDirectory(request.root) : "";

    bool own_users = true;
    pid_t inner = CloneInto(namespaces | CLONE_NEWUSER);
    if (inner < 0 && ::geteuid() == 0) {
        own_users = false;
        inner = CloneInto(namespaces);
    }
    if (inner < 0) {
        *why = std::strerror(errno);
        return -1;
    }
    if (inner == 0) {
        char may_go = 0;
        ::close(go[1]);
        ::close(report[0]);
        if (::read(go[0], &may_go, 1) != 1)
            ::_exit(exit_refused);
        Inside(request, own_users, kept, report[1]);
    }
    ::close(go[0]);
    ::close(report[1]);
    const bool mapped = !own_users || MapIds(inner);
    if (mapped)
        static_cast<void>(::write(go[1], "", 1));
    ::close(go[1]);

    const int ended = WaitFor(inner, false);
    Report result = {};
    const ssize_t told = ::read(report[0], &result, sizeof result);
    ::close(report[0]);
    if (!kept.empty())
        std::fprintf(stderr, "enter: kept %s\n", kept.c_str());
    if (told == ssize_t{sizeof result})
        return result.status;
    if (mapped && (WIFSIGNALED(ended) || WEXITSTATUS(ended) != exit_no_namespaces))
        return WIFSIGNALED(ended) ? ended : exit_refused << 8;
    *why = mapped ? "no right to mount" : "user ids cannot be mapped";
    return -1;
}

}  // namespace enter
