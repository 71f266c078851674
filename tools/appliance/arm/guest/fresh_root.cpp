// A throw-away copy of the whole root for one job: an overlay in a mount namespace of its own.
#include "fresh_root.h"

#include <cerrno>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <system_error>
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

}  // namespace

void EnterFreshRoot(const std::string &layer)
{
    Must(unshare(CLONE_NEWNS), "mount namespace");
    Must(mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr), "private mounts");
    // Half of the memory is the limit of a tmpfs: whoever fills the disk meets ENOSPC, not the end of the machine.
    Must(mount("fresh", place.c_str(), "tmpfs", 0, "mode=755"), "tmpfs");
    for (const char *directory : {"/upper", "/work", "/tavo-upper", "/tavo-work", "/root"})
        Must(mkdir((place + directory).c_str(), 0755), directory);
    const std::string lower = layer.empty() ? "/" : layer + ":/";
    Overlay(root, "lowerdir=" + lower + ",upperdir=/mnt/upper,workdir=/mnt/work");
    Overlay(root + "/usr/tavo", "lowerdir=/usr/tavo,upperdir=/mnt/tavo-upper,workdir=/mnt/tavo-work");
    Must(mount("tmp", (root + "/tmp").c_str(), "tmpfs", 0, "mode=1777"), "tmp");
    for (const char *path : {"/dev", "/sys", "/proc", "/host"})
        Carry(path);
    Must(mount("run", (root + "/run").c_str(), "tmpfs", 0, "mode=755"), "run");
    for (const char *directory : {"/run/lock", "/run/lvm", "/run/mdadm"})
        Must(mkdir((root + directory).c_str(), 0755), directory);
    Must(chroot(root.c_str()), "chroot");
    Must(chdir("/"), "chdir");
}

}  // namespace machine
