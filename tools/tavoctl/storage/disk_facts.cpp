// Disks and bays.
#include "storage/disk_facts.h"

#include "tavo_appliance.h"
#include "tavo_partition.h"

#include "frame/files.h"

#include <algorithm>
#include <iterator>

namespace tavoctl {
namespace {

std::string Trimmed(std::string text)
{
    const std::size_t first = text.find_first_not_of(" \t");
    return first == text.npos ? "" : text.substr(first, text.find_last_not_of(" \t\n") + 1 - first);
}

// The kernel keeps the page that the drive gave when it was found: a header of four bytes, and the number.
std::optional<std::string> SerialOf(const std::string &disk)
{
    const std::string page = FileText("/sys/block/" + DeviceName(disk) + "/device/vpd_pg80");
    constexpr std::size_t header = 4;
    return Maybe(page.size() > header ? Trimmed(page.substr(header)) : "");
}

std::optional<std::string> LayoutOf(const std::string &disk)
{
    int version = 0;
    for (const int raid : {1, 0})
        if (BlTAVOCheckPartitionLayout(disk.c_str(), raid, &version) == 1)
            return "version " + std::to_string(version) + (raid ? "" : " plain");
    int kind = 0;
    if (PartitionTableTypeGet(disk.c_str(), &kind) != 0)
        return {};
    return kind == PARTITION_TABLE_NONE ? "blank" : "foreign";
}

}  // namespace

std::optional<std::string> DiskFacts::State() const
{
    if (!there)
        return role.empty() ? "empty" : "pulled";
    return Maybe(power == Power::unknown ? "" : power == Power::standby ? "standby" : "spinning");
}

DiskFacts DescribeDisk(const std::string &path, bool wake, const std::vector<Array> &arrays)
{
    DiskFacts disk = {.path = path, .bay = BayOf(path), .power = PowerOf(path), .role = ArraysOf(arrays, path)};
    disk.asked = wake || disk.power == Power::spinning;
    char text[128];
    if (TAVOLnxDiskGetModel(path.c_str(), text, sizeof text) == 0)
        disk.model = Trimmed(text);
    disk.serial = SerialOf(path);
    disk.size = SizeOf(path);
    if (!disk.asked)
        return disk;
    disk.layout = LayoutOf(path);
    if (const int degrees = TAVODiskTemperatureGet(path.c_str()); degrees != -1)
        disk.temperature = degrees;
    return disk;
}

std::vector<DiskFacts> AllDisks(bool wake, const std::vector<Array> &arrays)
{
    auto disks = Mapped(DiskPaths(), [&](const std::string &path) { return DescribeDisk(path, wake, arrays); });
    std::vector<DiskFacts> sorted;
    for (int bay = 1; bay <= TAVOMaxDiskGet(); ++bay) {
        if (TAVOEBoxDevIs(bay - 1) == 1)
            continue;
        const auto here = std::find_if(disks.begin(), disks.end(),
                                       [&](const DiskFacts &disk) { return disk.bay == std::to_string(bay); });
        if (here != disks.end()) {
            sorted.push_back(std::move(*here));
            disks.erase(here);
            continue;
        }
        const std::string path = std::string("/dev/sd") + static_cast<char>('a' + bay - 1);
        sorted.push_back({.path = path, .bay = std::to_string(bay), .there = false, .role = ArraysOf(arrays, path)});
    }
    std::move(disks.begin(), disks.end(), std::back_inserter(sorted));
    for (DiskFacts &disk : NvmeDisks())
        sorted.push_back(std::move(disk));
    return sorted;
}

}  // namespace tavoctl
