// A disk or an image file: its size, its sectors, and telling the kernel what has changed.
#ifndef SFDISK_BLOCK_TARGET_H
#define SFDISK_BLOCK_TARGET_H

#include "table_entry.h"

#include <stdexcept>
#include <string>

namespace sfdisk {

// The failure, in words for an administrator; the program ends with it.
class Failure : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

enum class OpenMode {
    read,
    write,
    write_unused,  // refused while a file system, an array or anything else uses the disk or a partition of it
};

class BlockTarget {
  public:
    // Refuses what is neither a whole disk of 512-byte sectors nor a regular file of at least one.
    BlockTarget(const std::string &path, OpenMode mode);
    ~BlockTarget();
    BlockTarget(const BlockTarget &) = delete;
    BlockTarget &operator=(const BlockTarget &) = delete;

    const std::string &Path() const { return path_; }
    uint64_t Sectors() const { return sectors_; }
    int Descriptor() const { return fd_; }
    bool IsReadOnly() const { return read_only_; }

    Sector Read(uint64_t number) const;

    // In one write, and on the disk when it returns.
    void Write(uint64_t number, const Sector &sector);

    // Syncs all writes through the descriptor to the disk.
    void Sync();

    // Makes the kernel read the table again. It refuses that while partitions of the disk are in use; then it is
    // notified only of partition `changed` (0: of none). An image file has no partitions.
    void RereadTable(int changed, const TableEntry &entry);

  private:
    bool TellPartition(int number, const TableEntry &entry);

    std::string path_;
    int fd_ = -1;
    bool is_disk_ = false;
    bool read_only_ = false;
    uint64_t sectors_ = 0;
};

}  // namespace sfdisk

#endif
