// The appliance's volumes: file systems mounted at /volume1, /volume2, ...
#include "service/detail/volume_list.h"

#include <algorithm>
#include <climits>

#include <unistd.h>

namespace tavo {
namespace {

bool OneOf(std::string_view text, std::initializer_list<std::string_view> words)
{
    return std::find(words.begin(), words.end(), text) != words.end();
}

// The kernel's own path of the disk names the bus that the disk is connected to.
bool IsBehindUsb(std::string_view device)
{
    constexpr std::string_view dev = "/dev/";
    if (!device.starts_with(dev))
        return false;
    std::string disk(device.substr(dev.size()));
    disk.erase(disk.find_last_not_of("0123456789") + 1);
    char target[PATH_MAX];
    const ssize_t length = ::readlink(("/sys/block/" + disk).c_str(), target, sizeof target);
    return length > 0 && std::string_view(target, static_cast<size_t>(length)).find("/usb") != std::string_view::npos;
}

}  // namespace

std::vector<Volume> VolumesIn(const std::vector<Mount> &mounts)
{
    std::vector<Volume> volumes;
    for (const Mount &mount : mounts) {
        const int number = VolumeNumber(mount.point);
        if (number == 0)
            continue;
        std::erase_if(volumes, [&](const Volume &volume) { return volume.number == number; });
        volumes.push_back({number, mount.point, mount.source, mount.type, mount.Has("rw")});
    }
    std::sort(volumes.begin(), volumes.end(),
              [](const Volume &left, const Volume &right) { return left.number < right.number; });
    return volumes;
}

std::vector<Volume> MountedVolumes()
{
    std::vector<Mount> mounts;
    ReadMounts(mounts);  // as far as it can be read
    return VolumesIn(mounts);
}

VolumeKind KindOf(const Volume &volume)
{
    const std::string_view source = volume.source;
    if (OneOf(volume.file_system, {"nfs", "nfs4", "cifs", "smb3", "smbfs", "fuse.sshfs"}) || source.starts_with("//") ||
        source.find(":/") != std::string_view::npos)
        return kVolumeRemote;
    if (OneOf(volume.file_system, {"vfat", "msdos", "exfat", "ntfs", "ntfs3", "fuseblk", "hfs", "hfsplus"}) ||
        IsBehindUsb(source))
        return kVolumeExternal;
    return kVolumeInternal;
}

int VolumeType(std::string_view path)
{
    const std::string_view wanted = VolumeOf(path);
    for (const Volume &volume : MountedVolumes()) {
        if (volume.path == wanted)
            return KindOf(volume);
    }
    return -1;
}

}  // namespace tavo
