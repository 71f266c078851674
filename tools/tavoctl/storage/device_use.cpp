// Finds the user of a block device: a mount, swap, an array, a volume, or a program that has opened it exclusively.
#include "tavo_error.h"

#include "frame/failure.h"
#include "frame/files.h"
#include "storage/device.h"

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <sstream>

#include <fcntl.h>
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
    std::ifstream swaps("/proc/swaps");
    std::string line;
    std::getline(swaps, line);  // the heading
    while (std::getline(swaps, line))
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
    std::vector<Mount> mounts;
    std::ifstream file("/proc/mounts");
    for (std::string line; std::getline(file, line);) {
        Mount mount;
        std::istringstream words(line);
        if (words >> mount.source >> mount.place >> mount.type)
            mounts.push_back(mount);
    }
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
        if (const std::string use = UseOf(device); !use.empty())
            throw Failure{.attempted = attempted, .reason = use, .hint = "free it first", .status = exit_busy};
    }
}

}  // namespace tavoctl
