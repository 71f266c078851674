// Paths of disks.
#include "storage/detail/disk_path.h"

#include "core/detail/ascii.h"
#include "storage/detail/device_name.h"

#include <charconv>
#include <cstring>

namespace tavo {
namespace {

constexpr int32_t IndexOf(char letter)
{
    return letter - 'a' + 1;
}

constexpr char LetterOf(int32_t index)
{
    return static_cast<char>('a' + index - 1);
}

}  // namespace

ParsedDiskPath ParseDiskPath(const char *text)
{
    using Outcome = ParsedDiskPath::Outcome;
    const char *at = text + (std::string_view(text).starts_with(kDev) ? kDev.size() : 0);
    if (std::strncmp(at, "sd", 2) != 0)
        return {Outcome::no_disk, {}, nullptr};
    at += 2;
    DISKPATH path = {};
    if (!IsLower(at[0]))
        return {*at ? Outcome::bad_tail : Outcome::no_disk, {}, at};
    if (IsLower(at[1])) {
        path = {IndexOf(at[1]), DISK_NAME_UNIT, IndexOf(at[0]), 0};
        at += 2;
    } else {
        path = {IndexOf(at[0]), DISK_NAME_PORT, 0, 0};
        at += 1;
    }
    if (*at && *at != '\n' && !IsDigit(*at))
        return {Outcome::bad_tail, {}, at};
    if (IsDigit(*at) && std::from_chars(at, at + std::strlen(at), path.nPartition).ec != std::errc{})
        return {Outcome::bad_tail, {}, at};
    return {Outcome::good, path, nullptr};
}

std::string DiskDevice(const DISKPATH &path)
{
    std::string device = "/dev/sd";
    if (path.nNameKind == DISK_NAME_UNIT)
        device += LetterOf(path.iUnit);
    return device += LetterOf(path.iDisk);
}

std::string PortDevice(int index)
{
    return DiskDevice({index + 1, DISK_NAME_PORT, 0, 0});
}

}  // namespace tavo
