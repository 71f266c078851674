// The form for machines that refuse namespaces: chroot alone, on a throw-away copy.
#include "enter.h"

#include <csignal>
#include <cstdio>
#include <ctime>

#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

namespace enter {
namespace {

constexpr char lacking[] = "mount,pid,net,uts,ipc,proc,sys,pts,mknod,user,setns";

void MakeDevices(const std::string &place)
{
    struct Device {
        const char *name;
        unsigned major, minor;
    };
    const std::string dev = place + "/dev";
    for (const Device &device : {Device{"null", 1, 3}, Device{"zero", 1, 5}, Device{"full", 1, 7},
                                 Device{"random", 1, 8}, Device{"urandom", 1, 9}, Device{"tty", 5, 0}}) {
        const std::string path = dev + "/" + device.name;
        Must(::mknod(path.c_str(), S_IFCHR | 0666, makedev(device.major, device.minor)) == 0, "make", path);
        Must(::chmod(path.c_str(), 0666) == 0, "set the mode of", path);
    }
}

bool IsLater(const timespec &one, const timespec &other)
{
    return one.tv_sec > other.tv_sec || (one.tv_sec == other.tv_sec && one.tv_nsec > other.tv_nsec);
}

timespec Now()
{
    timespec now;
    ::clock_gettime(CLOCK_REALTIME_COARSE, &now);  // what files are stamped with
    return now;
}

// The stamp of everything that was written until now. What is written after this call has a later one: files are
// stamped in steps of a few milliseconds, and a command may run and edit within one of them.
timespec EndOfStamp()
{
    const timespec until = Now();
    const timespec pause{0, 200'000};
    while (!IsLater(Now(), until))
        ::nanosleep(&pause, nullptr);
    return until;
}

// A hard link shares its bytes with the tree. Programs and libraries are replaced, never edited. If one has been edited
// nevertheless, the user is warned and the next build rebuilds the tree.
std::string EditedFile(const std::string &path, const timespec &since)
{
    struct stat facts;
    if (::lstat(path.c_str(), &facts) != 0)
        return "";
    if (S_ISREG(facts.st_mode))
        return IsLater(facts.st_mtim, since) ? path : "";
    if (S_ISDIR(facts.st_mode)) {
        for (const std::string &name : NamesIn(path)) {
            if (std::string found = EditedFile(path + "/" + name, since); !found.empty())
                return found;
        }
    }
    return "";
}

}  // namespace

int EnterChroot(const Request &request, std::string *why)
{
    if (::geteuid() != 0) {
        *why = "chroot needs root";
        return -1;
    }
    const std::string tree = request.root + "/tree";
    const std::string place = MakeRunDirectory(request.root);
    unfinished = place;
    for (const Entry &entry : request.entries) {
        if (entry.kind == 'r')
            LinkTree(tree + "/" + entry.path, place + "/" + entry.path, tree + "/usr/tavo");
        else
            MakeEntry(entry, tree, place);
    }
    MakeDevices(place);
    for (const Bind &bind : request.binds) {
        MakeParents(place, bind.to);
        LinkTree(bind.from, place + bind.to, request.root);
    }
    if (!request.emulator.empty())
        CopyFile(request.emulator, place + "/run/emulator");

    ::prctl(PR_SET_CHILD_SUBREAPER, 1, 0, 0, 0);
    const timespec started = EndOfStamp();
    unfinished.clear();
    const pid_t command = ::fork();
    Must(command >= 0, "start", request.command[0]);
    if (command == 0) {
        ::prctl(PR_SET_PDEATHSIG, SIGKILL, 0, 0, 0);
        ::close_range(3, ~0U, 0);
        Must(::chroot(place.c_str()) == 0 && ::chdir("/") == 0, "enter", place);
        DropCapabilities(true);
        RunCommand(request, "chroot", lacking + std::string(request.emulator.empty() ? "" : ",foreign-exec"),
                   !request.emulator.empty());
    }
    const int status = WaitFor(command, false);
    KillLeftovers();
    if (request.keep)
        std::fprintf(stderr, "enter: kept %s\n", place.c_str());
    else
        RemoveTree(place);
    if (const std::string edited = EditedFile(tree + "/usr", started); !edited.empty()) {
        ::unlink((request.root + "/key").c_str());
        Die("the command changed %s in place; build the root again", edited.c_str());
    }
    return status;
}

}  // namespace enter
