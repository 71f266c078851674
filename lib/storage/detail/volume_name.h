// Names of volume groups and logical volumes, in the two spellings that the system has for their devices.
#ifndef TAVO_STORAGE_DETAIL_VOLUME_NAME_H
#define TAVO_STORAGE_DETAIL_VOLUME_NAME_H

#include <optional>
#include <string>
#include <string_view>

namespace tavo {

// A name of a group or volume that may become a word of a command: never an option, never a way out of a directory.
constexpr bool IsVolumeName(std::string_view name)
{
    constexpr std::string_view plain = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_.+-";
    return !name.empty() && name.size() < 120 && name[0] != '-' && name[0] != '.' &&
           name.find_first_not_of(plain) == name.npos && name.find("..") == name.npos;
}

// "/dev/vg" and such a name: the only paths that are ever removed with all that is below them.
constexpr bool IsGroupPath(std::string_view path)
{
    constexpr std::string_view dev = "/dev/";
    return path.starts_with("/dev/vg") && IsVolumeName(path.substr(dev.size()));
}

struct VolumeName {
    std::string group;
    std::string volume;

    bool operator==(const VolumeName &) const = default;
};

// "/dev/vg1/lv", or "/dev/mapper/vg1-lv" where a "-" of a name is doubled. Empty for other text.
std::optional<VolumeName> ParseVolumePath(std::string_view path);

// The volume `name` is a snapshot of `volume`: its name, "s" and perhaps a number.
bool IsSnapshotName(std::string_view name, std::string_view volume);

}  // namespace tavo

#endif
