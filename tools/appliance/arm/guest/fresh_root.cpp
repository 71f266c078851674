// A throw-away copy of the whole root for one job: an overlay in a mount namespace of its own.
#include "fresh_root.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <system_error>
#include <utility>

#include <net/if.h>
#include <sched.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

namespace machine {
namespace {

void Must(int result, const char *what)
{
    if (result != 0)
        throw std::system_error(errno, std::generic_category(), what);
}

const std::string place = "/mnt";
const std::string root = place + "/root";

void Carry(const char *path)
{
    Must(mount(path, (root + path).c_str(), nullptr, MS_BIND | MS_REC, nullptr), path);
}

void Overlay(const std::string &onto, const std::string &options)
{
    Must(mount("fresh", onto.c_str(), "overlay", 0, options.c_str()), "overlay");
}

void Make(const std::string &directory, mode_t mode = 0755)
{
    Must(mkdir(directory.c_str(), mode), directory.c_str());
}

// Makes only the devices of the ordinary appliance root: a program with scripted tools must not find the machine's
// disks.
void MakePlainDevices(const std::string &dev)
{
    struct Device {
        const char *name;
        unsigned major, minor;
    };
    Must(mount("dev", dev.c_str(), "tmpfs", 0, "mode=755"), "dev");
    for (const Device &device : {Device{"null", 1, 3}, Device{"zero", 1, 5}, Device{"full", 1, 7},
                                 Device{"random", 1, 8}, Device{"urandom", 1, 9}, Device{"tty", 5, 0}}) {
        const std::string path = dev + "/" + device.name;
        Must(mknod(path.c_str(), S_IFCHR | 0666, makedev(device.major, device.minor)), path.c_str());
        Must(chmod(path.c_str(), 0666), path.c_str());
    }
    Make(dev + "/pts");
    Make(dev + "/shm", 01777);
    Must(mount("devpts", (dev + "/pts").c_str(), "devpts", 0, "newinstance,ptmxmode=0666,mode=620"), "pts");
    Must(mount("shm", (dev + "/shm").c_str(), "tmpfs", 0, "mode=1777"), "shm");
    for (const auto &[name, target] : {std::pair{"fd", "/proc/self/fd"},
                                       {"stdin", "/proc/self/fd/0"},
                                       {"stdout", "/proc/self/fd/1"},
                                       {"stderr", "/proc/self/fd/2"},
                                       {"ptmx", "pts/ptmx"}})
        Must(symlink(target, (dev + "/" + name).c_str()), name);
}

void RaiseLoopback()
{
    const int control = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    ifreq request{};
    strcpy(request.ifr_name, "lo");
    request.ifr_flags = IFF_UP | IFF_RUNNING;
    Must(ioctl(control, SIOCSIFFLAGS, &request), "lo");
    close(control);
}

}  // namespace

void EnterFreshRoot(const std::string &layer, const std::string &host_at)
{
    const bool real = layer.empty();
    Must(unshare(CLONE_NEWNS | (real ? 0 : CLONE_NEWNET | CLONE_NEWUTS | CLONE_NEWIPC)), "namespaces");
    Must(mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr), "private mounts");
    // A tmpfs is limited to half of the memory: a program that fills the disk gets ENOSPC and does not kill the
    // machine.
    Must(mount("fresh", place.c_str(), "tmpfs", 0, "mode=755"), "tmpfs");
    for (const char *directory : {"/upper", "/work", "/tavo-upper", "/tavo-work", "/root"})
        Make(place + directory);
    const std::string lower = real ? "/" : layer + ":/";
    Overlay(root, "lowerdir=" + lower + ",upperdir=/mnt/upper,workdir=/mnt/work");
    Overlay(root + "/usr/tavo", "lowerdir=/usr/tavo,upperdir=/mnt/tavo-upper,workdir=/mnt/tavo-work");
    Must(mount("tmp", (root + "/tmp").c_str(), "tmpfs", 0, "mode=1777"), "tmp");
    for (const char *path : {"/proc", "/host"})
        Carry(path);
    if (real) {
        Carry("/dev");
        Carry("/sys");
    } else {
        MakePlainDevices(root + "/dev");
        Must(mount("sysfs", (root + "/sys").c_str(), "sysfs", MS_RDONLY, nullptr), "sys");
        Must(sethostname("tavo", 4), "host name");
        RaiseLoopback();
    }
    Must(mount("run", (root + "/run").c_str(), "tmpfs", 0, "mode=755"), "run");
    for (const char *directory : {"/run/lock", "/run/lvm", "/run/mdadm"})
        Make(root + directory);
    if (!host_at.empty()) {
        std::filesystem::create_directories(root + host_at);
        Must(mount("/host", (root + host_at).c_str(), nullptr, MS_BIND, nullptr), host_at.c_str());
    }
    Must(chroot(root.c_str()), "chroot");
    Must(chdir("/"), "chdir");
}

}  // namespace machine
