// The partition table of a disk.
#include "partition_table.h"

#include <algorithm>
#include <set>

namespace sfdisk {
namespace {

constexpr int kFirstLogical = 5;
constexpr int kLastLogical = 255;
constexpr size_t kLongestChain = 1024;  // an emptied link stays in the chain

// A chain starts in the first sector of the extended partition. Each of its sectors holds a logical partition, counted
// from that very sector, and a link to the next, counted from the start of the extended partition. A broken link ends
// the chain, as in the kernel.
void ReadLogical(const BlockTarget &disk, const TableEntry &extended, std::vector<Partition> &partitions)
{
    const uint64_t end = std::min(disk.Sectors(), extended.End());
    int number = std::max(kFirstLogical, partitions.back().number + 1);
    std::set<uint64_t> seen;
    uint64_t at = extended.start;
    while (at < end && seen.insert(at).second && seen.size() <= kLongestChain) {
        const Sector sector = disk.Read(at);
        if (!HasSignature(sector))
            return;
        uint64_t next = end;
        for (size_t slot = 0; slot < 2; ++slot) {
            TableEntry entry = ReadEntry(sector, slot);
            if (entry.IsEmpty())
                continue;
            if (entry.IsExtended()) {
                next = extended.start + entry.start;
            } else if (at + entry.End() <= end && number <= kLastLogical) {
                entry.start += at;
                partitions.push_back({number++, entry, at, slot});
            }
        }
        at = next;
    }
}

std::string PartitionName(int number)
{
    return "partition " + std::to_string(number);
}

}  // namespace

std::vector<Partition> ReadPartitions(const BlockTarget &disk)
{
    const Sector sector = disk.Read(0);
    if (!HasSignature(sector))
        throw Failure("has no partition table");
    std::vector<Partition> partitions;
    for (size_t slot = 0; slot < 4; ++slot) {
        const TableEntry entry = ReadEntry(sector, slot);
        if (!entry.IsEmpty())
            partitions.push_back({static_cast<int>(slot) + 1, entry, 0, slot});
    }
    const size_t primary = partitions.size();
    for (size_t i = 0; i < primary; ++i) {
        if (partitions[i].entry.IsExtended())
            ReadLogical(disk, TableEntry(partitions[i].entry), partitions);
    }
    return partitions;
}

std::optional<Partition> FindPartition(const std::vector<Partition> &partitions, int number)
{
    const auto found = std::find_if(partitions.begin(), partitions.end(),
                                    [&](const Partition &partition) { return partition.number == number; });
    return found == partitions.end() ? std::nullopt : std::optional(*found);
}

Room RoomOf(uint64_t disk_sectors)
{
    return {.first = 1,
            .end = std::min(disk_sectors, kAddressableSectors),
            .has_logical = true,
            .end_name = "of the disk or of sector 2^32"};
}

TableEntry PlacePartition(const std::vector<Partition> &partitions, const Room &room, const Wish &wish)
{
    const auto counts = [&](const Partition &other) {
        return !room.has_logical || other.number < kFirstLogical;
    };
    uint64_t before = 0;
    for (const Partition &partition : partitions) {
        if (partition.number < wish.number && counts(partition))
            before = partition.entry.End();
    }
    const uint64_t offset = wish.start.value_or(wish.gap);
    const uint64_t start = wish.start ? offset : before + offset;
    if (offset >= room.end || start >= room.end)
        throw Failure(PartitionName(wish.number) + " would start beyond the end " + room.end_name);
    if (start < room.first)
        throw Failure(PartitionName(wish.number) + " would cover the partition table");
    const uint64_t count = wish.count.value_or(room.end - start);
    if (count > room.end - start)
        throw Failure(PartitionName(wish.number) + " would reach beyond the end " + room.end_name);
    for (const Partition &other : partitions) {
        const bool apart = other.entry.End() <= start || start + count <= other.entry.start;
        if (other.number != wish.number && counts(other) && !apart)
            throw Failure(PartitionName(wish.number) + " would overlap " + PartitionName(other.number));
    }
    return {.boot = 0, .type = wish.type, .start = start, .count = count};
}

}  // namespace sfdisk
