// What the program does: list, create, empty one entry, write an empty table.
#include "commands.h"

#include "partition_table.h"

#include <cinttypes>
#include <cstdio>

namespace sfdisk {
namespace {

constexpr uint8_t kGuidTable = 0xEE;
constexpr int kLastPrimary = 4;

struct TypeName {
    uint8_t type;
    const char *name;
};

constexpr TypeName kTypeNames[] = {
    {0x01, "FAT12"},
    {0x05, "Extended"},
    {0x06, "FAT16"},
    {0x07, "HPFS/NTFS"},
    {0x0B, "Win95 FAT32"},
    {0x0C, "Win95 FAT32 (LBA)"},
    {0x0F, "Win95 Ext'd (LBA)"},
    {0x82, "Linux swap"},
    {0x83, "Linux"},
    {0x85, "Linux extended"},
    {0x8E, "Linux LVM"},
    {0xEE, "EFI GPT"},
    {0xFD, "Linux raid autodetect"},
};

const char *NameOf(uint8_t type)
{
    for (const TypeName &row : kTypeNames) {
        if (row.type == type)
            return row.name;
    }
    return "Unknown";
}

OpenMode ModeOf(const Options &options)
{
    return options.force ? OpenMode::write : OpenMode::write_unused;
}

// The name of a partition's device: a digit at the end of the disk's name is kept apart by a "p".
std::string DeviceOf(const std::string &disk, int number)
{
    const bool digit = disk.back() >= '0' && disk.back() <= '9';
    return disk + (digit ? "p" : "") + std::to_string(number);
}

// The library reads the first 63 characters of a line and counts blank-separated words, so there is no column that may
// be empty, and none before the device that a boot flag could take.
void PrintLine(const std::string &disk, const Partition &partition)
{
    const TableEntry &entry = partition.entry;
    std::printf("%s %" PRIu32 " %" PRIu64 " %" PRIu32 " %x %s\n", DeviceOf(disk, partition.number).c_str(), entry.start,
                entry.End() - 1, entry.count, unsigned{entry.type}, NameOf(entry.type));
}

}  // namespace

int RunList(const Options &options)
{
    const BlockTarget disk(options.path, OpenMode::read);
    // On a blank disk too the partition asked for is just not there.
    if (options.number && !HasSignature(disk.Read(0)))
        return 1;
    bool any = options.number == 0;
    for (const Partition &partition : ReadPartitions(disk)) {
        if (options.number && partition.number != options.number)
            continue;
        PrintLine(disk.Path(), partition);
        any = true;
    }
    return any ? 0 : 1;
}

int RunCreate(const Options &options)
{
    if (options.number > kLastPrimary)
        throw Failure("only partitions 1 to 4 can be created");
    if (TableEntry{.type = options.type}.IsExtended())
        throw Failure("extended partitions cannot be created");
    BlockTarget disk(options.path, ModeOf(options));
    const std::vector<Partition> partitions = ReadPartitions(disk);
    for (const Partition &partition : partitions) {
        if (partition.entry.type == kGuidTable)
            throw Failure("has a GUID partition table (-M1 replaces it)");
    }
    const Wish wish = {options.number, options.start, options.gap.value_or(0), options.count, options.type};
    const TableEntry entry = PlacePartition(partitions, disk.Sectors(), wish);
    if (!options.quiet && !options.count && entry.End() < disk.Sectors())
        std::fprintf(stderr, "sfdisk: %s: the sectors from 2^32 on stay unused\n", options.path.c_str());
    Sector sector = disk.Read(0);
    WriteEntry(sector, static_cast<size_t>(options.number) - 1, entry);
    disk.Write(0, sector);
    if (options.reread)
        disk.RereadTable(options.number, entry);
    return 0;
}

int RunClear(const Options &options)
{
    BlockTarget disk(options.path, ModeOf(options));
    const std::vector<Partition> partitions = ReadPartitions(disk);
    const std::optional<Partition> partition = FindPartition(partitions, options.number);
    if (!partition) {
        if (options.number <= kLastPrimary)
            return 0;
        throw Failure("has no partition " + std::to_string(options.number));
    }
    Sector sector = disk.Read(partition->sector);
    WriteEntry(sector, partition->slot, TableEntry{});
    disk.Write(partition->sector, sector);
    if (options.reread)
        disk.RereadTable(options.number, TableEntry{});
    return 0;
}

int RunLabel(const Options &options)
{
    BlockTarget disk(options.path, ModeOf(options));
    // All of the sector: what is left of a file system's first sector would make the disk look like one.
    Sector sector = {};
    SetSignature(sector);
    disk.Write(0, sector);
    if (options.reread)
        disk.RereadTable(0, TableEntry{});
    return 0;
}

}  // namespace sfdisk
