// The volumes.
#include "storage/volumes.h"

#include "frame/files.h"
#include "frame/text.h"
#include "storage/device.h"
#include "storage/volume_groups.h"

#include <algorithm>
#include <array>

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

namespace tavoctl {
namespace {

// Device mapper writes "vg1-lv", and each dash of the names twice.
std::optional<std::pair<std::string, std::string>> SplitName(const std::string &mapped)
{
    std::string parts[2];
    int at = 0;
    for (std::size_t i = 0; i < mapped.size(); ++i) {
        const bool dash = mapped[i] == '-';
        const bool twice = dash && i + 1 < mapped.size() && mapped[i + 1] == '-';
        if (dash && !twice && ++at > 1)
            return std::nullopt;
        if (dash && !twice)
            continue;
        parts[at] += mapped[i];
        i += twice;
    }
    return at == 1 ? std::optional(std::pair(parts[0], parts[1])) : std::nullopt;
}

bool IsSameDevice(const std::string &left, const std::string &right)
{
    struct stat a, b;
    return ::stat(left.c_str(), &a) == 0 && ::stat(right.c_str(), &b) == 0 && S_ISBLK(a.st_mode) &&
           S_ISBLK(b.st_mode) && a.st_rdev == b.st_rdev;
}

void LookAtMount(Volume &volume)
{
    for (const Mount &mount : Mounts())
        if (mount.source.starts_with("/dev/") && IsSameDevice(mount.source, volume.device))
            volume.mount = mount.place;
    struct statvfs facts;
    if (volume.mount.empty() || ::statvfs(volume.mount.c_str(), &facts) != 0)
        return;
    volume.capacity = Bytes{uint64_t{facts.f_blocks} * facts.f_frsize};
    volume.available = Bytes{uint64_t{facts.f_bavail} * facts.f_frsize};
}

std::optional<Volume> ReadMapped(const std::string &block)
{
    const auto uuid = KernelText(block + "/dm/uuid");
    const auto split = SplitName(KernelText(block + "/dm/name").value_or(""));
    if (!uuid || !uuid->starts_with("LVM-") || !split)
        return std::nullopt;
    Volume volume = {split->first, "/dev/" + split->first + "/" + split->second, {}, true, {}, {}, {}, {}};
    volume.devices = FolderNames(block + "/slaves");
    std::sort(volume.devices.begin(), volume.devices.end());
    volume.size = Bytes{std::stoull(KernelText(block + "/size").value_or("0")) * 512};
    LookAtMount(volume);
    return volume;
}

void AddInactive(std::vector<Volume> &volumes)
{
    for (const LVMPV &pv : PhysicalVolumes()) {
        const std::string group = DeviceName(pv.szVg);
        if (group.empty())
            continue;
        const auto known =
            std::find_if(volumes.begin(), volumes.end(), [&](const Volume &volume) { return volume.group == group; });
        if (known == volumes.end())
            volumes.push_back({group, "/dev/" + group + "/lv", {DeviceName(pv.szPv)}, false, {}, {}, {}, {}});
        else if (!known->active)
            known->devices.push_back(DeviceName(pv.szPv));
    }
}

}  // namespace

std::optional<int> Volume::Number() const
{
    const auto number = group.starts_with("vg") ? NumberIn<int>(group.substr(2)) : std::nullopt;
    return number && *number >= 1 ? number : std::nullopt;
}

std::vector<Volume> ReadVolumes(bool all)
{
    std::vector<Volume> volumes;
    for (const std::string &name : FolderNames("/sys/block"))
        if (name.starts_with("dm-"))
            if (auto volume = ReadMapped("/sys/block/" + name))
                volumes.push_back(std::move(*volume));
    if (all && LVMIsSupport() == 1)
        AddInactive(volumes);
    std::sort(volumes.begin(), volumes.end(), [](const Volume &left, const Volume &right) {
        return std::pair(left.Number().value_or(1 << 20), left.device) <
               std::pair(right.Number().value_or(1 << 20), right.device);
    });
    return volumes;
}

std::string VolumePath(int number)
{
    return "/volume" + std::to_string(number);
}

std::string VolumeGroupOf(int number)
{
    return "/dev/vg" + std::to_string(number);
}

std::optional<ExtFileSystem> ReadExtFileSystem(const std::string &device)
{
    constexpr off_t place = 1024;
    std::array<unsigned char, 1024> block = {};
    const Descriptor file(::open(device.c_str(), O_RDONLY | O_CLOEXEC));
    const bool read =
        file.IsOpen() && ::pread(file.Get(), block.data(), block.size(), place) == static_cast<ssize_t>(block.size());
    const auto number = [&](std::size_t at, int bytes) {
        uint64_t value = 0;
        for (int i = bytes; i-- > 0;)
            value = value << 8 | block[at + static_cast<std::size_t>(i)];
        return value;
    };
    constexpr uint64_t magic = 0xEF53;
    constexpr uint64_t wide = 0x80;  // of the features: block numbers have 64 bits
    constexpr uint64_t most_shift = 6;
    if (!read || number(56, 2) != magic || number(24, 4) > most_shift)
        return std::nullopt;
    const uint64_t blocks = number(4, 4) | (number(96, 4) & wide ? number(0x150, 4) << 32 : 0);
    return ExtFileSystem{blocks << (10 + number(24, 4)), (number(58, 2) & 2) == 0};
}

}  // namespace tavoctl
