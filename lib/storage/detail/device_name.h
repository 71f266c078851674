// Names of disks and partitions: which text may become a path or a word of a command.
#ifndef TAVO_STORAGE_DETAIL_DEVICE_NAME_H
#define TAVO_STORAGE_DETAIL_DEVICE_NAME_H

#include <string_view>

namespace tavo {

inline constexpr std::string_view kDev = "/dev/";

// A name in /dev, /sys/block or /proc/partitions: "sda3", "md2", "mmcblk0p1". Never a way out of the directory and
// never an option.
constexpr bool IsDeviceName(std::string_view name)
{
    constexpr std::string_view plain = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_.:+-";
    return !name.empty() && name.size() < 64 && name[0] != '.' && name[0] != '-' &&
           name.find_first_not_of(plain) == std::string_view::npos && name.find("..") == std::string_view::npos;
}

// "/dev/" and such a name.
constexpr bool IsDevicePath(std::string_view path)
{
    return path.starts_with(kDev) && IsDeviceName(path.substr(kDev.size()));
}

constexpr std::string_view WithoutDev(std::string_view path)
{
    return path.starts_with(kDev) ? path.substr(kDev.size()) : path;
}

// The text after the last slash; all of it when there is none.
constexpr std::string_view LastPart(std::string_view path)
{
    return path.substr(path.rfind('/') + 1);
}

// "sda10" is a partition of "sda".
constexpr std::string_view WithoutNumber(std::string_view name)
{
    return name.substr(0, name.find_last_not_of("0123456789") + 1);
}

}  // namespace tavo

#endif
