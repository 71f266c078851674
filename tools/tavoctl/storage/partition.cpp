// tavoctl partition: the partition tables of the disks, read.
#include "families.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/table.h"
#include "storage/disk_verb.h"
#include "storage/partitions.h"

#include "tavo_lvm.h"
#include "tavo_partition.h"

#include <cstdio>

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
    AddPartitionChange(partition);
    partition.Add<PartitionTable>();
}

}  // namespace tavoctl
