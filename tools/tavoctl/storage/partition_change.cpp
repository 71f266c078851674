// tavoctl partition: making and cleaning what a disk of the system has.
#include "tavo_lvm.h"
#include "tavo_partition.h"

#include "frame/containers.h"
#include "storage/device.h"
#include "storage/partitions.h"

#include <algorithm>

#include <sys/stat.h>

namespace tavoctl {

int NumberOf(const std::string &partition)
{
    return std::stoi(partition.substr(partition.find_first_of("0123456789")));
}

std::vector<std::string> PartitionsOf(const std::string &disk)
{
    const std::string name = DeviceName(disk);
    const PARTITIONFILTER filter = {name.c_str(), 0};
    StringList paths;
    Must(PartitionPathEnum(&filter, paths.Address()) >= 0, "list the partitions of " + disk);
    std::vector<std::string> partitions;
    for (const std::string &path : paths.Items()) {
        const std::string rest = path.substr(std::min(path.size(), disk.size()));
        if (!rest.empty() && rest.size() < 4 && rest.find_first_not_of("0123456789") == rest.npos)
            partitions.push_back(path);
    }
    return partitions;
}

namespace {

// Either the system's two partitions or the data partition: in one go the one would undo the other.
int FlagsOf(bool system, bool data, const std::string &attempted)
{
    RefuseIf(system == data, attempted, system ? "--system would undo --data" : "--system or --data is required",
             "first --system, then --data");
    return system ? PARTITION_SYSTEM : PARTITION_DATA;
}

// Other systems have another tool of this name, so an installation keeps the appliance's own in a folder of its own.
void RequireTool(const std::string &attempted)
{
    constexpr const char *partitioning_tool = "/sbin/sfdisk";
    struct stat in_place = {}, installed = {};
    const bool missing = ::stat(partitioning_tool, &in_place) != 0;
    const bool aside = ::stat("/usr/lib/tavo-appliance/sfdisk", &installed) == 0;
    FailIf(missing || (aside && (in_place.st_ino != installed.st_ino || in_place.st_dev != installed.st_dev)),
           attempted, std::string(partitioning_tool) + (missing ? " is missing" : " is not the appliance's own tool"),
           "run tavo-appliance-setup, of the package tavo-appliance");
}

std::vector<std::string> DataPartitions(const std::string &disk)
{
    std::vector<std::string> partitions = PartitionsOf(disk);
    std::erase_if(partitions, [](const std::string &partition) { return NumberOf(partition) < 3; });
    return partitions;
}

}  // namespace

Action PartitionMake(Arguments &in)
{
    const auto words = in.Texts("DISK", disk_kind, disk_help);
    const auto system = in.Flag("--system", "partitions 1 and 2 alone, on an empty table");
    const auto data = in.Flag("--data", "partition 3 alone");
    const auto version =
        in.Number("--version", "VERSION", "of the layout; 0: the one that the system carries (0)", 0, 99);
    return [=](Call &call) {
        RequireTool("make partitions on " + Joined(*words, ", "));
        const std::vector<std::string> paths = DiskPaths(*words);
        const std::string attempted = "make partitions on " + Joined(paths, ", ");
        // In one call for both the second would undo the first.
        std::vector<int> steps;
        if (*system || !*data)
            steps.push_back(PARTITION_SYSTEM);
        if (*data || !*system)
            steps.push_back(PARTITION_DATA);
        int layout = static_cast<int>(version->value_or(0));
        RefuseIf(TAVOPartitionLayoutIdxGet(layout, LVMIsSupport()) < 0, attempted,
                 "there is no layout of version " + std::to_string(layout), "tavoctl partition layout shows them");
        // Partition 3 is made after the others, which may be in use.
        const bool empties = steps[0] == PARTITION_SYSTEM;
        if (empties)
            RefuseUsed(paths, attempted);
        for (const std::string &path : paths) {
            RefuseTooLarge(SizeOfAll({path}), attempted);
            FailIf(!empties && PartitionsOf(path).size() > 2, attempted, path + " has a data partition",
                   "clean it first");
            call.Change(path, "partitions", PartitionsOf(path), !empties ? "3" : steps.size() > 1 ? "1, 2, 3" : "1, 2");
        }
        const std::string all = Joined(paths, ", ");
        if (!call.Proceed(empties ? "Lose all partitions of " + all + "?" : "Make partition 3 of " + all + "?"))
            return;
        for (const std::string &path : paths)
            for (const int step : steps)
                Must(PartitionCreate(path.c_str(), step, layout ? &layout : nullptr) == 0, "make partitions on " + path,
                     log_hint);
    };
}

Action PartitionErase(Arguments &in)
{
    const auto disk = in.Text("DISK", disk_kind, disk_help);
    const auto system = in.Flag("--system", "partitions 1 and 2, and with the table the others");
    const auto data = in.Flag("--data", "partitions 3 to 15");
    const auto table = in.Flag("--table", "the table alone");
    return [=](Call &call) {
        RequireTool("clean " + *disk);
        const std::string path = DiskPath(*disk);
        const std::string attempted = "clean " + path;
        RefuseIf(*table && (*system || *data), attempted, "--table excludes --system and --data");
        const int flags = *table ? 0 : FlagsOf(*system, *data, attempted);
        const bool some = flags == PARTITION_DATA;
        RefuseUsed(some ? DataPartitions(path) : std::vector<std::string>{path}, attempted);
        call.Change(path, "partitions", some ? DataPartitions(path) : PartitionsOf(path), {});
        if (call.report.changes.empty())
            call.Change(path, "partition table", {}, "empty");
        if (call.Proceed(std::string("Lose ") + (some ? "the data partitions of " : "all partitions of ") + path + "?"))
            Must((*table ? PartitionAddTable(path.c_str()) : PartitionClean(path.c_str(), flags)) == 0, attempted,
                 log_hint);
    };
}

}  // namespace tavoctl
