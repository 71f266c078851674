// The partition table of a disk: four primary entries, and the chain of sectors that holds the logical ones.
#ifndef SFDISK_PARTITION_TABLE_H
#define SFDISK_PARTITION_TABLE_H

#include "block_target.h"
#include "table_entry.h"

#include <optional>
#include <vector>

namespace sfdisk {

// A partition as the kernel numbers it.
struct Partition {
    int number;        // 1 to 4 for primary ones, 5 and up in the order of the chain
    TableEntry entry;  // its start counts from the start of the disk here
    uint64_t sector;   // the sector of the table that holds it, and the slot there
    size_t slot;
};

// All partitions that are there, in the order of their numbers. Throws Failure without a table.
std::vector<Partition> ReadPartitions(const BlockTarget &disk);

std::optional<Partition> FindPartition(const std::vector<Partition> &partitions, int number);

// Where a new primary partition goes.
struct Wish {
    int number;
    std::optional<uint64_t> start;  // or, when empty, the gap
    uint64_t gap;                   // from the end of the partition before it, or from the start of the disk
    std::optional<uint64_t> count;  // empty: the rest
    uint8_t type;
};

// Where partitions can be.
struct Room {
    uint64_t first;
    uint64_t end;      // the first sector beyond
    bool has_logical;  // partitions from 5 on are within another one
    const char *end_name;
};

// That of an MS-DOS table.
Room RoomOf(uint64_t disk_sectors);

// The entry that the wish makes. Throws Failure when it does not fit: beyond the disk or what a table can address, onto
// the table itself, or onto another partition.
TableEntry PlacePartition(const std::vector<Partition> &partitions, const Room &room, const Wish &wish);

}  // namespace sfdisk

#endif
