// Finds the user of a block device: a mount, swap, an array, a volume, or a program that has opened it exclusively.
#include "tavo_error.h"

#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/files.h"
#include "storage/device.h"

#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <memory>

#include <fcntl.h>
#include <mntent.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>

namespace tavoctl {
namespace {

namespace fs = std::filesystem;

std::optional<dev_t> DeviceNumber(const std::string &path)
{
    struct stat state;
    if (::stat(path.c_str(), &state) != 0 || !S_ISBLK(state.st_mode))
        return std::nullopt;
    return state.st_rdev;
}

// Two names may mean one device: /dev/vg1/lv and /dev/mapper/vg1-lv.
std::string MountOf(dev_t number)
{
    for (const Mount &mount : Mounts())
        if (DeviceNumber(mount.source) == number)
            return " is mounted on " + mount.place;
    for (const std::string &line : Split(FileText("/proc/swaps"), '\n'))
        if (DeviceNumber(line.substr(0, line.find_first_of(" \t"))) == number)
            return " is swap space";
    return "";
}

std::string HolderOf(const fs::path &device)
{
    const fs::path holders = device / "holders";
    for (const std::string &name : FolderNames(holders)) {
        const auto mapped = KernelText(holders / name / "dm/name");
        return " belongs to " + (mapped ? "the volume " + *mapped : "/dev/" + name);
    }
    return "";
}

bool IsClaimed(const std::string &path)
{
    const Descriptor device(::open(path.c_str(), O_RDONLY | O_EXCL | O_NONBLOCK | O_CLOEXEC));
    return !device.IsOpen() && errno == EBUSY;
}

}  // namespace

std::vector<Mount> Mounts()
{
    const std::unique_ptr<std::FILE, By<::endmntent>> file(::setmntent("/proc/self/mounts", "re"));
    FailIf(!file, "list the mounted file systems", "/proc/self/mounts cannot be read");
    std::vector<Mount> mounts;
    while (const mntent *mount = ::getmntent(file.get()))
        mounts.push_back({mount->mnt_fsname, mount->mnt_dir, mount->mnt_type});
    return mounts;
}

std::string UseOf(const std::string &device)
{
    const auto number = DeviceNumber(device);
    if (!number)
        return "";
    const fs::path place = "/sys/dev/block/" + std::to_string(major(*number)) + ":" + std::to_string(minor(*number));
    for (const std::string &use : {MountOf(*number), HolderOf(place)})
        if (!use.empty())
            return device + use;
    std::error_code none;
    for (const std::string &name : FolderNames(place)) {
        if (!fs::exists(place / name / "partition", none))
            continue;
        const std::string use = UseOf("/dev/" + name);
        if (!use.empty())
            return use;
    }
    return IsClaimed(device) ? device + " is in use" : "";
}

void RefuseUsed(const std::vector<std::string> &devices, const std::string &attempted)
{
    for (const std::string &device : devices) {
        if (!DeviceNumber(device))
            throw NotFound(attempted + ": " + device, ERR_FILE_NOT_FOUND, "check the name");
        const std::string use = UseOf(device);
        BusyIf(!use.empty(), attempted, use, "free it first");
    }
}

}  // namespace tavoctl
