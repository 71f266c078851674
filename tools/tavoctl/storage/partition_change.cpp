// tavoctl partition: making and cleaning what a disk of the system has.
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "storage/disk_verb.h"
#include "storage/partitions.h"

#include "tavo_lvm.h"
#include "tavo_partition.h"

#include <algorithm>

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
    if (PartitionPathEnum(&filter, paths.Address()) < 0)
        throw LibraryFailure("list the partitions of " + disk);
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
struct Choice {
    bool system = false;
    bool data = false;

    void Declare(Arguments &arguments, const char *of_system, const char *of_data)
    {
        arguments.Flag("--system", system, of_system);
        arguments.Flag("--data", data, of_data);
    }
    int Flags(const std::string &attempted) const
    {
        if (system == data)
            throw UsageFailure(attempted, system ? "--system would undo --data" : "say --system or --data",
                               "first --system, then --data");
        return system ? PARTITION_SYSTEM : PARTITION_DATA;
    }
};

class CreatePartitions : public DiskVerb {
  public:
    static constexpr VerbInfo info = {"create", changes | destroys,
                                      "Makes the system's partitions on a disk: --system partitions 1 and 2, on an "
                                      "empty table, so that a data partition "
                                      "is gone too; --data partition 3, in a second call. What is on the disk is lost. "
                                      "A disk that is in use is refused.",
                                      "tavoctl partition create --system sdb\n"
                                      "tavoctl partition create --yes --data sdb\n"
                                      "tavoctl partition create --system --version 6 sdb"};

    void Declare(Arguments &arguments) override
    {
        DiskVerb::Declare(arguments);
        choice_.Declare(arguments, "partitions 1 and 2, on an empty table", "partition 3");
        arguments.Number("--version", "VERSION", version_, "of the layout; 0: the one that the system carries (0)");
    }

    int Run(const Call &call) override
    {
        const std::string path = DiskPath(disk_);
        const std::string attempted = "make partitions on " + path;
        const int flags = choice_.Flags(attempted);
        if (TAVOPartitionLayoutIdxGet(version_, LVMIsSupport()) < 0)
            throw UsageFailure(attempted, "there is no layout of version " + std::to_string(version_),
                               "tavoctl partition layout shows them");
        // Partition 3 is made behind the others, which may be in use.
        if (flags == PARTITION_SYSTEM)
            RefuseUsed({path}, attempted);
        else if (PartitionsOf(path).size() > 2)
            throw Failure{.attempted = attempted, .reason = "there is a data partition", .hint = "clean it first"};
        call.Confirm(flags == PARTITION_SYSTEM ? "Lose all partitions of " + path + "?" : "Make " + path + "3?");
        if (PartitionCreate(path.c_str(), flags, version_ ? &version_ : nullptr) != 0)
            throw LibraryFailure(attempted, "look at the system log");
        return exit_done;
    }

  private:
    Choice choice_;
    int version_ = 0;
};

class CleanPartitions : public DiskVerb {
  public:
    static constexpr VerbInfo info = {"clean", changes | destroys,
                                      "Empties entries of a disk's partition table and erases the RAID superblocks "
                                      "there: --data partitions 3 and up, "
                                      "--system all. --table only writes an empty table. What is in use is refused.",
                                      "tavoctl partition clean --data sdb\n"
                                      "tavoctl partition clean --yes --system sdb"};

    void Declare(Arguments &arguments) override
    {
        DiskVerb::Declare(arguments);
        choice_.Declare(arguments, "partitions 1 and 2, and with the table the others", "partitions 3 to 15");
        arguments.Flag("--table", table_, "the table alone");
    }

    int Run(const Call &call) override
    {
        const std::string path = DiskPath(disk_);
        const std::string attempted = "clean " + path;
        if (table_ && (choice_.system || choice_.data))
            throw UsageFailure(attempted, "--table goes alone");
        const int flags = table_ ? 0 : choice_.Flags(attempted);
        if (flags == PARTITION_DATA)
            RefuseUsed(DataPartitions(path), attempted);
        else
            RefuseUsed({path}, attempted);
        call.Confirm(flags == PARTITION_DATA ? "Lose the data partitions of " + path + "?"
                                             : "Lose all partitions of " + path + "?");
        const int result = table_ ? PartitionAddTable(path.c_str()) : PartitionClean(path.c_str(), flags);
        if (result != 0)
            throw LibraryFailure(attempted, "look at the system log");
        return exit_done;
    }

  private:
    static std::vector<std::string> DataPartitions(const std::string &disk)
    {
        std::vector<std::string> partitions = PartitionsOf(disk);
        std::erase_if(partitions, [](const std::string &partition) { return NumberOf(partition) < 3; });
        return partitions;
    }

    Choice choice_;
    bool table_ = false;
};

}  // namespace

void AddPartitionChange(Family &partition)
{
    partition.Add<CreatePartitions>();
    partition.Add<CleanPartitions>();
}

}  // namespace tavoctl
