// The commands of the program: list, create, empty one entry, write an empty table.
#include "commands.h"

#include "guid_table.h"
#include "partition_table.h"

#include <cinttypes>
#include <cstdio>

namespace sfdisk {
namespace {

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
    std::printf("%s %" PRIu64 " %" PRIu64 " %" PRIu64 " %x %s\n", DeviceOf(disk, partition.number).c_str(), entry.start,
                entry.End() - 1, entry.count, unsigned{entry.type}, NameOf(entry.type));
}

// The partitions of a table of either kind. A damaged GUID table is what its protective entry says.
std::vector<Partition> ReadAny(const BlockTarget &disk)
{
    if (HasGuidTable(disk)) {
        try {
            return GuidTable(disk).Partitions();
        } catch (const Failure &) {
        }
    }
    return ReadPartitions(disk);
}

Wish WishOf(const Options &options)
{
    return {options.number, options.start, options.gap.value_or(0), options.count, options.type};
}

TableEntry CreateEntry(BlockTarget &disk, const Options &options)
{
    const std::vector<Partition> partitions = ReadPartitions(disk);
    const TableEntry entry = PlacePartition(partitions, RoomOf(disk.Sectors()), WishOf(options));
    if (!options.quiet && !options.count && entry.End() < disk.Sectors())
        std::fprintf(stderr, "sfdisk: %s: the sectors from 2^32 on stay unused (-M1 makes a table for them)\n",
                     options.path.c_str());
    Sector sector = disk.Read(0);
    WriteEntry(sector, static_cast<size_t>(options.number) - 1, entry);
    disk.Write(0, sector);
    return entry;
}

TableEntry CreateGuidEntry(BlockTarget &disk, const Options &options)
{
    GuidTable table(disk);
    const TableEntry entry = PlacePartition(table.Partitions(), table.Usable(), WishOf(options));
    table.Put(options.number, entry);
    table.Write();
    disk.Sync();
    return entry;
}

void ClearEntry(BlockTarget &disk, const Partition &partition)
{
    Sector sector = disk.Read(partition.sector);
    WriteEntry(sector, partition.slot, TableEntry{});
    disk.Write(partition.sector, sector);
}

void ClearGuidEntry(BlockTarget &disk, const Partition &partition)
{
    GuidTable table(disk);
    table.Remove(partition.number);
    table.Write();
    disk.Sync();
}

// A GUID table whose first copy is gone would come back from the one at the end.
void EraseGuidHeaders(BlockTarget &disk)
{
    for (const uint64_t number : {uint64_t{1}, disk.Sectors() - 1}) {
        if (number < disk.Sectors() && number > 0 && IsGuidHeader(disk.Read(number)))
            disk.Write(number, Sector{});
    }
}

}  // namespace

int RunList(const Options &options)
{
    const BlockTarget disk(options.path, OpenMode::read);
    // On a blank disk too the partition asked for is just not there.
    if (options.number && !HasSignature(disk.Read(0)))
        return 1;
    bool any = options.number == 0;
    for (const Partition &partition : ReadAny(disk)) {
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
    const TableEntry entry = HasGuidTable(disk) ? CreateGuidEntry(disk, options) : CreateEntry(disk, options);
    if (options.reread)
        disk.RereadTable(options.number, entry);
    return 0;
}

int RunClear(const Options &options)
{
    BlockTarget disk(options.path, ModeOf(options));
    const bool guid = HasGuidTable(disk);
    const std::optional<Partition> partition =
        FindPartition(guid ? GuidTable(disk).Partitions() : ReadPartitions(disk), options.number);
    if (!partition) {
        if (options.number <= kLastPrimary)
            return 0;
        throw Failure("has no partition " + std::to_string(options.number));
    }
    if (guid)
        ClearGuidEntry(disk, *partition);
    else
        ClearEntry(disk, *partition);
    if (options.reread)
        disk.RereadTable(options.number, TableEntry{});
    return 0;
}

int RunLabel(const Options &options)
{
    BlockTarget disk(options.path, ModeOf(options));
    if (NeedsGuidTable(disk)) {
        GuidTable::Create(disk);
        disk.Sync();
    } else {
        EraseGuidHeaders(disk);
        // The whole sector: the rest of a file system's first sector would make the disk look like one.
        Sector sector = {};
        SetSignature(sector);
        disk.Write(0, sector);
    }
    if (options.reread)
        disk.RereadTable(0, TableEntry{});
    return 0;
}

}  // namespace sfdisk
