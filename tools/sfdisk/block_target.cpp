// A disk or an image file.
#include "block_target.h"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <linux/blkpg.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace sfdisk {
namespace {

std::string Because(const char *what)
{
    return std::string(what) + ": " + std::strerror(errno);
}

}  // namespace

BlockTarget::BlockTarget(const std::string &path, OpenMode mode) : path_(path), read_only_(mode == OpenMode::read)
{
    // Without waiting: a FIFO in the place of a disk has no other end.
    const int access = mode == OpenMode::read ? O_RDONLY : O_RDWR;
    const int unused = mode == OpenMode::write_unused ? O_EXCL : 0;  // means this for disks, and nothing for files
    fd_ = ::open(path.c_str(), access | unused | O_CLOEXEC | O_NONBLOCK | O_NOCTTY);
    if (fd_ < 0)
        throw Failure(Because("cannot open"));
    try {
        struct stat facts;
        if (::fstat(fd_, &facts) != 0)
            throw Failure(Because("cannot look at it"));
        is_disk_ = S_ISBLK(facts.st_mode);
        uint64_t bytes = static_cast<uint64_t>(facts.st_size);
        if (is_disk_) {
            int sector_bytes = 0;
            if (::ioctl(fd_, BLKGETSIZE64, &bytes) != 0 || ::ioctl(fd_, BLKSSZGET, &sector_bytes) != 0)
                throw Failure(Because("cannot ask for its size"));
            // A table counts in the disk's own sectors, and every geometry of ours in sectors of 512 bytes.
            if (sector_bytes != static_cast<int>(kSectorBytes))
                throw Failure("has sectors of " + std::to_string(sector_bytes) + " bytes, not 512");
        } else if (!S_ISREG(facts.st_mode)) {
            throw Failure("is neither a disk nor an image file");
        }
        sectors_ = bytes / kSectorBytes;
        if (sectors_ == 0)
            throw Failure("is smaller than a sector");
    } catch (...) {
        ::close(fd_);
        throw;
    }
}

BlockTarget::~BlockTarget()
{
    ::close(fd_);
}

Sector BlockTarget::Read(uint64_t number) const
{
    Sector sector;
    ssize_t got;
    do {
        got = ::pread(fd_, sector.data(), kSectorBytes, static_cast<off_t>(number * kSectorBytes));
    } while (got < 0 && errno == EINTR);
    if (got != ssize_t{kSectorBytes})
        throw Failure(got < 0 ? Because("cannot read") : "ends within a sector");
    return sector;
}

void BlockTarget::Write(uint64_t number, const Sector &sector)
{
    ssize_t written;
    do {
        written = ::pwrite(fd_, sector.data(), kSectorBytes, static_cast<off_t>(number * kSectorBytes));
    } while (written < 0 && errno == EINTR);
    if (written != ssize_t{kSectorBytes})
        throw Failure(written < 0 ? Because("cannot write") : "took only a part of a sector");
    Sync();
}

void BlockTarget::Sync()
{
    if (::fsync(fd_) != 0)
        throw Failure(Because("cannot sync"));
}

void BlockTarget::RereadTable(int changed, const TableEntry &entry)
{
    if (!is_disk_ || ::ioctl(fd_, BLKRRPART, nullptr) == 0)
        return;
    if (errno == EBUSY && changed && TellPartition(changed, entry))
        return;
    throw Failure(Because("the table is written, but the kernel still uses the old one"));
}

bool BlockTarget::TellPartition(int number, const TableEntry &entry)
{
    blkpg_partition partition = {};
    partition.pno = number;
    blkpg_ioctl_arg request = {};
    request.datalen = sizeof partition;
    request.data = &partition;
    request.op = BLKPG_DEL_PARTITION;
    if (::ioctl(fd_, BLKPG, &request) != 0 && errno != ENXIO)
        return false;
    if (entry.IsEmpty())
        return true;
    partition.start = static_cast<long long>(entry.start) * static_cast<long long>(kSectorBytes);
    partition.length = static_cast<long long>(entry.count) * static_cast<long long>(kSectorBytes);
    request.op = BLKPG_ADD_PARTITION;
    return ::ioctl(fd_, BLKPG, &request) == 0;
}

}  // namespace sfdisk
