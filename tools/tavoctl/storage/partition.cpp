// tavoctl partition: the partition tables of the disks.
#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/table.h"
#include "storage/disk_verb.h"

#include "tavo_lvm.h"
#include "tavo_partition.h"

#include <cctype>
#include <cstdio>
#include <iterator>

namespace tavoctl {
namespace {

std::string TypeText(uint32_t type)
{
    char text[8];
    std::snprintf(text, sizeof text, "0x%02X", type);
    return text;
}

std::string TypeName(uint32_t type)
{
    for (const PARTTYPE *row = PartType; row->szName; ++row) {
        if (row->nType == type)
            return row->szName;
    }
    return "";
}

int NumberOf(const std::string &partition)
{
    return std::stoi(partition.substr(partition.find_first_of("0123456789")));
}

// In the order of the kernel's list.
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

class PartitionList : public Verb {
  public:
    static constexpr VerbInfo info = {"list", reads,
                                      "Lists the partitions of a disk, or of all: sectors are of 512 bytes. Of a disk "
                                      "in standby only what the kernel "
                                      "knows is shown, unless --wake is given.",
                                      "tavoctl partition list\n"
                                      "tavoctl partition list --json sda"};

    void Declare(Arguments &arguments) override
    {
        arguments.OptionalText("DISK", disk_, disk_help, DiskNames);
        arguments.Flag("--wake", wake_, wake_help);
    }

    int Run(const Call &call) override
    {
        Table table({"partition", "start", "sectors", "size", "type", "name", "use"});
        for (const std::string &disk : disk_.empty() ? DiskPaths() : std::vector<std::string>{DiskPath(disk_)}) {
            const bool asks = MayRead(disk, wake_);
            for (const std::string &partition : PartitionsOf(disk))
                table.Add(Row(disk, partition, asks));
        }
        call.Print(table);
        return exit_done;
    }

  private:
    static std::vector<Cell> Row(const std::string &disk, const std::string &partition, bool asks)
    {
        int64_t start = 0;
        uint32_t type = 0;
        const int64_t sectors = asks ? RCPartitionConfigs(NumberOf(partition), disk.c_str(), &start, &type) : -1;
        uint64_t counted = 0;
        const bool sized = DiskSizeGet(partition.c_str(), &counted) == 1;
        return {DeviceName(partition),
                sectors < 0 ? Cell() : Cell(start),
                sectors < 0 ? Cell() : Cell(sectors),
                sized ? Cell(Bytes{counted * 512}) : Cell(),
                sectors < 0 ? Cell() : Cell(TypeText(type)),
                sectors < 0 ? Cell() : Cell(TypeName(type)),
                Known(UseOf(partition))};
    }

    std::string disk_;
    bool wake_ = false;
};

class PartitionLayout : public Verb {
  public:
    static constexpr VerbInfo info = {
        "layout", reads,
        "Shows which layout of the system a disk carries. Without DISK: every layout there has been, in sectors of 512 "
        "bytes, and which one new disks get.",
        "tavoctl partition layout sda\n"
        "tavoctl partition layout"};

    void Declare(Arguments &arguments) override
    {
        arguments.OptionalText("DISK", disk_, disk_help, DiskNames);
        arguments.Flag("--wake", wake_, wake_help);
    }

    int Run(const Call &call) override
    {
        if (disk_.empty())
            PrintAll(call);
        else
            PrintOne(call);
        return exit_done;
    }

  private:
    void PrintAll(const Call &call) const
    {
        RefuseToWakeAny(wake_, "find the layout of the system");
        int current = 0;
        if (PartitionLayoutGet(&current) != 0)
            throw LibraryFailure("find the layout of the system");
        const int raid = LVMIsSupport();
        Table table({"version", "raid", "start_1", "sectors_1", "start_2", "sectors_2", "gap", "types", "current"});
        for (const TAVOPARTLAYOUT &row : grgAllTavoPartLayout) {
            std::vector<std::string> types;
            for (const TAVOPARTPLACE &place : {row.place1, row.place2, row.place3})
                types.push_back(TypeText(place.nType));
            table.Add({int{row.nVersion}, row.fRaid != 0, int64_t{row.place1.nStart}, int64_t{row.place1.cSector},
                       int64_t{row.place2.nStart}, int64_t{row.place2.cSector}, static_cast<int64_t>(row.cGap), types,
                       row.nVersion == current && (row.fRaid != 0) == (raid == 1)});
        }
        call.Print(table);
    }

    void PrintOne(const Call &call) const
    {
        const std::string path = DiskPath(disk_);
        const std::string attempted = "read the layout of " + path;
        RefuseToWake(path, wake_, attempted);
        for (const int raid : {1, 0}) {
            int version = 0;
            if (BlTAVOCheckPartitionLayout(path.c_str(), raid, &version) != 1)
                continue;
            Record record;
            record.Add("disk", path);
            record.Add("version", version);
            record.Add("raid", raid == 1);
            call.Print(record);
            return;
        }
        throw Failure{.attempted = attempted,
                      .reason = "its partitions are none of the system's",
                      .hint = "tavoctl partition list shows them",
                      .status = exit_not_found};
    }

    std::string disk_;
    bool wake_ = false;
};

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

class PartitionTable : public WakingVerb {
  public:
    static constexpr VerbInfo info = {"table", reads, "Prints the kind of a disk's partition table: none, mbr or gpt.",
                                      "tavoctl partition table sda"};

    int Run(const Call &call) override
    {
        const std::string path = DiskPath(disk_);
        const std::string attempted = "read the partition table of " + path;
        RefuseToWake(path, wake_, attempted);
        int kind = 0;
        if (PartitionTableTypeGet(path.c_str(), &kind) != 0)
            throw LibraryFailure(attempted);
        const char *text = kind == PARTITION_TABLE_GPT ? "gpt" : kind == PARTITION_TABLE_MBR ? "mbr" : "none";
        Record record;
        record.Add("disk", path);
        record.Add("table", text);
        call.PrintValue(text, record);
        return exit_done;
    }
};

}  // namespace

void AddPartition(Program &program)
{
    Family &partition = program.Add("partition", "Partition tables of the disks");
    partition.Add<PartitionList>();
    partition.Add<PartitionLayout>();
    partition.Add<CreatePartitions>();
    partition.Add<CleanPartitions>();
    partition.Add<PartitionTable>();
}

}  // namespace tavoctl
