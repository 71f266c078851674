// tavoctl partition: the partition tables of the disks.
#include "tavo_lvm.h"
#include "tavo_partition.h"

#include "families.h"
#include "storage/device.h"
#include "storage/partitions.h"

#include <cstdio>

namespace tavoctl {
namespace {

struct PartitionFacts {
    std::string path;
    std::optional<int64_t> start, sectors;
    std::optional<Bytes> size;
    std::optional<std::string> type, name;
};

constexpr Column<PartitionFacts> partition_columns[] = {
    {"partition", [](const PartitionFacts &p) { return DeviceName(p.path); }},
    {"start", field<&PartitionFacts::start>, "", in_list, "sectors of 512 bytes"},
    {"sectors", field<&PartitionFacts::sectors>, "of 512 bytes"},
    {"size", field<&PartitionFacts::size>},
    {"type", field<&PartitionFacts::type>, "hexadecimal"},
    {"name", field<&PartitionFacts::name>, "of the type"},
    {"use", [](const PartitionFacts &p) { return Maybe(UseOf(p.path)); }, "why it must not be overwritten"},
};

struct LayoutFacts {
    TAVOPARTLAYOUT layout;
    bool current;
};

std::string TypeText(uint32_t type)
{
    char text[8];
    std::snprintf(text, sizeof text, "0x%02X", type);
    return text;
}

constexpr Column<LayoutFacts> layout_columns[] = {
    {"version", [](const LayoutFacts &l) { return l.layout.nVersion; }},
    {"raid", [](const LayoutFacts &l) { return l.layout.fRaid != 0; }},
    {"start_1", [](const LayoutFacts &l) { return static_cast<int64_t>(l.layout.place1.nStart); }},
    {"sectors_1", [](const LayoutFacts &l) { return static_cast<int64_t>(l.layout.place1.cSector); }},
    {"start_2", [](const LayoutFacts &l) { return static_cast<int64_t>(l.layout.place2.nStart); }},
    {"sectors_2", [](const LayoutFacts &l) { return static_cast<int64_t>(l.layout.place2.cSector); }},
    {"gap", [](const LayoutFacts &l) { return static_cast<int64_t>(l.layout.cGap); }, "", in_list, "sectors"},
    {"types",
     [](const LayoutFacts &l) {
         return std::vector{TypeText(l.layout.place1.nType), TypeText(l.layout.place2.nType),
                            TypeText(l.layout.place3.nType)};
     },
     "hexadecimal"},
    {"current", field<&LayoutFacts::current>, "new disks get it"},
};

struct DiskLayout {
    std::string disk;
    int version;
    bool raid;
};

constexpr Column<DiskLayout> disk_layout_columns[] = {
    {"disk", field<&DiskLayout::disk>},
    {"version", field<&DiskLayout::version>},
    {"raid", field<&DiskLayout::raid>},
};

struct DiskTable {
    std::string disk, table;
};

constexpr Column<DiskTable> disk_table_columns[] = {
    {"disk", field<&DiskTable::disk>},
    {"table", field<&DiskTable::table>, "none, mbr or gpt"},
};

std::string TypeNameOf(uint32_t type)
{
    for (const PARTTYPE *row = PartType; row->szName; ++row)
        if (row->nType == type)
            return row->szName;
    return "";
}

PartitionFacts DescribePartition(const std::string &disk, const std::string &path, bool asks)
{
    PartitionFacts partition = {path, {}, {}, {}, {}, {}};
    int64_t start = 0;
    uint32_t type = 0;
    const int64_t sectors = asks ? RCPartitionConfigs(NumberOf(path), disk.c_str(), &start, &type) : -1;
    if (sectors >= 0) {
        partition.start = start;
        partition.sectors = sectors;
        partition.type = TypeText(type);
        partition.name = TypeNameOf(type);
    }
    partition.size = SizeOf(path);
    return partition;
}

Action PartitionList(Arguments &in)
{
    const auto disk = in.OptionalText("DISK", disk_kind, disk_help);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) {
        std::vector<PartitionFacts> partitions;
        for (const std::string &path : *disk ? std::vector<std::string>{DiskPath(**disk)} : DiskPaths()) {
            const bool asks = MayRead(path, *wake);
            for (const std::string &partition : PartitionsOf(path))
                partitions.push_back(DescribePartition(path, partition, asks));
        }
        call.List(partition_columns, partitions);
    };
}

Action PartitionLayout(Arguments &in)
{
    const auto disk = in.OptionalText("DISK", disk_kind, disk_help);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) {
        if (!*disk) {
            const std::string attempted = "find the layout of the system";
            RefuseToWakeAny(*wake, attempted);
            int current = 0;
            Must(PartitionLayoutGet(&current) == 0, attempted);
            const bool raid = LVMIsSupport() == 1;
            return call.List(layout_columns, Mapped(grgAllTavoPartLayout, [=](const TAVOPARTLAYOUT &row) {
                                 return LayoutFacts{row, row.nVersion == current && (row.fRaid != 0) == raid};
                             }));
        }
        const std::string path = DiskPath(**disk);
        const std::string attempted = "read the layout of " + path;
        RefuseToWake(path, *wake, attempted);
        for (const bool raid : {true, false}) {
            int version = 0;
            if (BlTAVOCheckPartitionLayout(path.c_str(), raid, &version) == 1)
                return call.One(disk_layout_columns, DiskLayout{path, version, raid});
        }
        throw Absent(attempted, "its partitions are none of the system's", "tavoctl partition list shows them");
    };
}

Action PartitionTable(Arguments &in)
{
    const auto disk = in.Text("DISK", disk_kind, disk_help);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) {
        const std::string path = DiskPath(*disk);
        const std::string attempted = "read the partition table of " + path;
        RefuseToWake(path, *wake, attempted);
        int kind = 0;
        Must(PartitionTableTypeGet(path.c_str(), &kind) == 0, attempted);
        const char *text = kind == PARTITION_TABLE_GPT ? "gpt" : kind == PARTITION_TABLE_MBR ? "mbr" : "none";
        call.Value(text, disk_table_columns, DiskTable{path, text});
    };
}

}  // namespace

void AddPartition(Program &program)
{
    Family &partition = program.Add("partition", "Partition tables of the disks");
    partition.Add("list", reads, Answer::List(partition_columns), PartitionList,
                  R"(Lists the partitions of a disk, or of all. Of a disk
in standby only what the kernel knows is shown, unless --wake is given.

tavoctl partition list
tavoctl partition list --json sda)");
    partition.Add("layout", reads, Answer::List(layout_columns).OrOne(disk_layout_columns), PartitionLayout,
                  R"(Shows which layout of the
system a disk carries. Without DISK: every layout there has been, in sectors of 512 bytes, and which one new disks get.

tavoctl partition layout sda
tavoctl partition layout)");
    partition.Add("create", changes | destroys, PartitionMake, R"(Makes the system's partitions on disks: 1 and 2 for
the system, on an empty table, and 3 for data. --system and --data make these alone; --system also loses a data
partition. What is on the disks is lost. A disk that is in use is refused.

tavoctl partition create sdb
tavoctl partition create --yes sda sdb sdc sdd
tavoctl partition create --system --version 6 sdb
tavoctl partition create --yes --data sdb)");
    partition.Add("clean", changes | destroys, PartitionErase, R"(Empties entries of a disk's partition table and erases
the RAID superblocks there. --data empties partitions 3 and up, --system all. --table only writes an empty table. What
is in use is refused.

tavoctl partition clean --data sdb
tavoctl partition clean --yes --system sdb)");
    partition.Add("table", reads, Answer::One(disk_table_columns), PartitionTable,
                  R"(Prints the kind of a disk's partition table: none,
mbr or gpt.

tavoctl partition table sda)");
}

}  // namespace tavoctl
