// The volumes that are mounted.
#include "storage/mounted_volumes.h"

#include "frame/failure.h"
#include "frame/lists.h"
#include "frame/text.h"
#include "storage/device.h"

#include <map>

namespace tavoctl {
namespace {

constexpr std::string_view prefix = "/volume";

// Returns 0 for a path that is not that of a volume.
int VolumeNumber(std::string_view path)
{
    return path.starts_with(prefix) ? NumberIn<int>(path.substr(prefix.size())).value_or(0) : 0;
}

}  // namespace

std::vector<MountedVolume> MountedVolumes()
{
    std::map<int, MountedVolume> found;
    for (const Mount &mount : Mounts())
        if (const int number = VolumeNumber(mount.place); number > 0)
            found[number] = {number, mount.place, mount.source};  // the last mount covers the earlier ones
    return Mapped(found, [](const auto &one) { return one.second; });
}

MountedVolume FindVolume(int number)
{
    for (const MountedVolume &volume : MountedVolumes())
        if (volume.number == number)
            return volume;
    throw Absent("find volume " + std::to_string(number), "it is not mounted");
}

const ArgumentKind volume_kind = {
    .name = "volume",
    .allowed = "a number from 1 on",
    .valid = [](const std::string &number) { return VolumeNumber(std::string(prefix) + number) > 0; },
    .sample = "9998",
    .wrong = "one",
};

MountedVolume FindVolume(const std::string &number)
{
    return FindVolume(VolumeNumber(std::string(prefix) + number));
}

}  // namespace tavoctl
