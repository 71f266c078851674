// A disk opened for raw commands, with the interface that its controller takes them through.
#ifndef TAVO_STORAGE_DETAIL_RAW_DISK_H
#define TAVO_STORAGE_DETAIL_RAW_DISK_H

#include "core/detail/owner.h"
#include "core/detail/result.h"
#include "storage/detail/drive_page.h"

#include <cstdint>
#include <string>

namespace tavo {

// Read-only and non-blocking; only what has a disk's major number, so that no other device gets a drive's commands.
// 0, ERR_OPEN_RAWDEVICE, ERR_STAT_FAILED or ERR_NOT_A_DISK.
Code OpenRawDisk(const char *path, Fd &fd);

// Returns whether the disk's controller is that of the system-on-chip: 1 or 0; -1 with the path that cannot be read.
int HangsOnMarvell(const char *path, std::string &unreadable);

class RawDisk {
  public:
    // 0, or a code of OpenRawDisk.
    Code Open(const char *path);

    // Takes any device that opens, for data that is only read. False with errno.
    bool OpenToRead(const char *path);

    bool IsMarvell() const { return marvell_; }
    int Descriptor() const { return fd_.Get(); }

    // A command of tavo_disk.h through the controller's interface: 0 or -1.
    int Command(int number, unsigned char *data) const;

    // The identification, of a packet device too.
    bool Identify(DrivePage &identity) const;

    // One ATA command without data through HDIO_DRIVE_CMD.
    bool DriveCommand(uint8_t command, uint8_t count = 0, uint8_t feature = 0) const;

  private:
    void ChooseInterface(const char *path);

    Fd fd_;
    bool marvell_ = false;
};

}  // namespace tavo

#endif
