// Names of volume groups and logical volumes.
#include "storage/detail/volume_name.h"

namespace tavo {
namespace {

constexpr std::string_view kMapper = "/dev/mapper/";
constexpr std::string_view kDevices = "/dev/";

std::optional<VolumeName> Checked(VolumeName name)
{
    return IsVolumeName(name.group) && IsVolumeName(name.volume) ? std::optional(std::move(name)) : std::nullopt;
}

std::optional<VolumeName> ParseMapperName(std::string_view text)
{
    VolumeName name;
    std::string *part = &name.group;
    for (size_t i = 0; i < text.size(); ++i) {
        if (text[i] != '-') {
            *part += text[i];
        } else if (text.substr(i).starts_with("--")) {
            *part += text[i++];
        } else if (part == &name.group) {
            part = &name.volume;
        } else {
            return std::nullopt;
        }
    }
    return Checked(std::move(name));
}

}  // namespace

std::optional<VolumeName> ParseVolumePath(std::string_view path)
{
    if (path.starts_with(kMapper))
        return ParseMapperName(path.substr(kMapper.size()));
    if (!path.starts_with(kDevices))
        return std::nullopt;
    path.remove_prefix(kDevices.size());
    const size_t slash = path.find('/');
    if (slash == path.npos)
        return std::nullopt;
    return Checked({std::string(path.substr(0, slash)), std::string(path.substr(slash + 1))});
}

bool IsSnapshotName(std::string_view name, std::string_view volume)
{
    if (!name.starts_with(volume) || !name.substr(volume.size()).starts_with('s'))
        return false;
    return name.substr(volume.size() + 1).find_first_not_of("0123456789") == name.npos;
}

}  // namespace tavo
