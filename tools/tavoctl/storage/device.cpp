// Block devices: their names and their power state.
#include "storage/device.h"

#include "tavo_appliance.h"
#include "tavo_partition.h"

#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/files.h"
#include "frame/text.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>

#include <sys/stat.h>
#include <sys/utsname.h>
#include <unistd.h>

namespace tavoctl {
namespace {

constexpr std::string_view dev = "/dev/";

// Bays come before units and ports; sdb before sdaa.
bool IsBefore(const std::string &left, const std::string &right)
{
    return left.size() != right.size() ? left.size() < right.size() : left < right;
}

std::vector<std::string> Names(const PARTITIONFILTER &filter)
{
    StringList paths;
    if (PartitionPathEnum(&filter, paths.Address()) < 0)
        return {};
    return Mapped(paths.Items(), DeviceName);
}

bool IsDeviceName(const std::string &word)
{
    const std::string name = word.starts_with(dev) ? word.substr(dev.size()) : word;
    return !name.empty() && name.front() != '-' && std::all_of(name.begin(), name.end(), [](unsigned char c) {
        return std::isalnum(c) || c == '-' || c == '_';
    });
}

bool IsDiskName(const std::string &word)
{
    DISKPATH parsed;
    return IsDeviceName(word) && DiskPathParse(DevicePath(word).c_str(), &parsed) == 0 && parsed.nPartition == 0 &&
           !std::isdigit(static_cast<unsigned char>(word.back()));
}

// The number of a disk's port: of ".../ata4/host3/target3:0:0/3:0:0:0" 4, of ".../0:0:3:0" 3.
std::optional<int> PortOf(const std::string &name)
{
    std::error_code none;
    const std::string place = std::filesystem::canonical("/sys/block/" + name + "/device", none);
    if (const std::size_t ata = place.find("/ata"); ata != place.npos)
        return std::atoi(place.c_str() + ata + 4);
    int host, channel, target, unit;
    const char *const last = place.c_str() + place.rfind('/') + 1;
    return std::sscanf(last, "%d:%d:%d:%d", &host, &channel, &target, &unit) == 4 ? std::optional(target)
                                                                                  : std::nullopt;
}

// The bays' ports have consecutive numbers: one disk that has its bay's name shows all of them.
std::string BayOfPort(const std::string &disk)
{
    const auto port = PortOf(DeviceName(disk));
    const auto name = [](int bay) { return std::string("sd") + static_cast<char>('a' + bay - 1); };
    const int bays = TAVOMaxDiskGet();
    for (int bay = 1; port && bay <= bays; ++bay) {
        const auto other = PortOf(name(bay));
        const int mine = other ? *port - *other + bay : 0;
        if (mine >= 1 && mine <= bays && !PortOf(name(mine)))
            return std::to_string(mine);
    }
    return "";
}

}  // namespace

std::string DevicePath(const std::string &word)
{
    return word.starts_with(dev) ? word : std::string(dev) + word;
}

std::vector<std::string> DevicePaths(const std::vector<std::string> &words)
{
    return Mapped(words, DevicePath);
}

std::string DeviceName(const std::string &path)
{
    return path.substr(path.rfind('/') + 1);
}

std::string DiskPath(const std::string &word)
{
    const std::string path = DevicePath(word);
    struct stat state;
    if (::stat(path.c_str(), &state) != 0)
        throw NotFound("use " + path, ERR_FILE_NOT_FOUND,
                       DidYouMean(DeviceName(path), DiskNames(), "tavoctl disk list shows the disks"));
    return path;
}

std::vector<std::string> DiskPaths(const std::vector<std::string> &words)
{
    return Mapped(words, DiskPath);
}

std::vector<std::string> DiskPaths()
{
    int32_t *numbers = nullptr;
    const int count = TAVODiskEnum(1, &numbers);
    Must(count >= 0, "list the disks");
    const std::unique_ptr<int32_t, By<std::free>> owner(numbers);
    std::vector<std::string> paths;
    for (int i = 0; i < count; ++i) {
        TAVODISKINFO *info = nullptr;
        if (TAVODiskGetInfo(1, numbers[i], &info) != 0)
            continue;  // gone since
        const std::unique_ptr<TAVODISKINFO, By<std::free>> summary(info);
        if (std::string_view(info->szName).starts_with("sd"))
            paths.push_back(std::string(dev) + info->szName);
    }
    std::sort(paths.begin(), paths.end(), IsBefore);
    return paths;
}

std::vector<std::string> DiskNames()
{
    std::vector<std::string> names = Names({"sd", 0});
    std::erase_if(names, [](const std::string &name) { return std::isdigit(static_cast<unsigned char>(name.back())); });
    return names;
}

std::vector<std::string> DeviceNames()
{
    return Names({nullptr, 0});
}

std::string BayOf(const std::string &disk)
{
    int container = 0;
    DISKPATH parsed;
    if (DiskContainerGet(disk.c_str(), &container) != 0 || DiskPathParse(disk.c_str(), &parsed) != 0)
        return "";
    switch (container) {
    case DISK_CONTAINER_INTERNAL:
        return parsed.iDisk <= TAVOMaxDiskGet() ? std::to_string(parsed.iDisk) : BayOfPort(disk);
    case DISK_CONTAINER_UNIT:
        return std::to_string(parsed.iUnit) + "-" + std::to_string(parsed.iDisk);
    case DISK_CONTAINER_ESATA:
        return "esata";
    default:
        return "usb";
    }
}

Power PowerOf(const std::string &disk)
{
    unsigned char state = 0;
    if (TAVOIDiskCheckPower(disk.c_str(), &state) != 0)
        return Power::unknown;
    return state == 0 ? Power::standby : Power::spinning;
}

bool Sleeps(const std::string &device)
{
    const std::string disk = device.substr(0, device.find_last_not_of("0123456789") + 1);
    return disk.starts_with("/dev/sd") && PowerOf(disk) == Power::standby;
}

bool MayRead(const std::string &disk, bool wake)
{
    return wake || PowerOf(disk) == Power::spinning;
}

void RefuseUnreadable(const std::string &device, const std::string &attempted)
{
    if (::eaccess(device.c_str(), R_OK) != 0 && errno == EACCES)
        throw SystemFailure(attempted, EACCES);
}

void RefuseToWake(const std::string &disk, bool wake, const std::string &attempted)
{
    RefuseUnreadable(disk, attempted);
    const Power power = wake ? Power::spinning : PowerOf(disk);
    FailIf(power != Power::spinning, attempted,
           disk + (power == Power::standby ? " is in standby" : " does not report whether it sleeps"),
           "--wake reads it anyway");
}

void RefuseToWakeAny(bool wake, const std::string &attempted)
{
    if (wake)
        return;
    for (const std::string &disk : DiskPaths())
        if (PowerOf(disk) == Power::standby)
            RefuseToWake(disk, false, attempted);
}

void RefuseTooLarge(uint64_t size, const std::string &attempted)
{
    constexpr uint64_t most = uint64_t{1} << 44;  // 2^32 pages of 4 KiB
    struct utsname system;
    const std::string machine = ::uname(&system) == 0 ? system.machine : "";
    const bool narrow = sizeof(void *) == 4 && !machine.ends_with("64");
    FailIf(narrow && size > most, attempted, "larger than the 16 TiB of one device that this system can reach",
           "use several smaller ones");
}

std::optional<Bytes> SizeOf(const std::string &device)
{
    uint64_t sectors = 0;
    return DiskSizeGet(device.c_str(), &sectors) == 1 ? std::optional(Bytes{sectors * 512}) : std::nullopt;
}

uint64_t SizeOfAll(const std::vector<std::string> &devices)
{
    uint64_t size = 0;
    for (const std::string &device : devices)
        size += SizeOf(device).value_or(Bytes{0}).count;
    return size;
}

const ArgumentKind disk_kind = {
    .name = "disk",
    .allowed = "the name of a disk, sda or /dev/sda",
    .valid = IsDiskName,
    .candidates = DiskNames,
    .sample = "sdzz",
    .wrong = "sda3",
};

const ArgumentKind device_kind = {
    .name = "device",
    .allowed = "the name of a device, sda3 or /dev/sda3",
    .valid = IsDeviceName,
    .candidates = DeviceNames,
    .sample = "sdzz3",
    .wrong = "../sda3",
};

}  // namespace tavoctl
