// GUID partition tables, for disks that are larger than an MS-DOS table can describe. libfdisk reads and writes them:
// both headers with their checksums, and the protective MS-DOS table.
#ifndef SFDISK_GUID_TABLE_H
#define SFDISK_GUID_TABLE_H

#include "block_target.h"
#include "partition_table.h"

#include <memory>
#include <vector>

struct fdisk_context;

namespace sfdisk {

// Returns whether a disk has so many sectors that it gets such a table.
inline bool NeedsGuidTable(const BlockTarget &disk)
{
    return disk.Sectors() > kAddressableSectors;
}

// Returns whether the first sector says that the disk has such a table.
bool HasGuidTable(const BlockTarget &disk);

// Returns whether a sector is the header of such a table, in order or not.
bool IsGuidHeader(const Sector &sector);

class GuidTable {
  public:
    // The table of the disk; a changed one is written with Write. Throws Failure when both copies are damaged.
    explicit GuidTable(const BlockTarget &disk);

    // Writes an empty table; its partitions can begin at sector 34.
    static void Create(const BlockTarget &disk);

    // In the order of their numbers; their types as an MS-DOS table has them, EFI GPT for one that it has not.
    std::vector<Partition> Partitions() const;

    // Where partitions can be.
    Room Usable() const;

    // The type is fd, 82 or 83. Throws Failure for another one, or a number beyond the table.
    void Put(int number, const TableEntry &entry);
    void Remove(int number);

    // Both copies, and on the disk when it returns.
    void Write();

  private:
    struct Release {
        void operator()(fdisk_context *context) const;
    };
    using Context = std::unique_ptr<fdisk_context, Release>;

    static Context Open(const BlockTarget &disk);

    Context context_;
};

}  // namespace sfdisk

#endif
