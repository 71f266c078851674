// One SCSI command to an open disk, through the SG_IO request.
#ifndef TAVO_STORAGE_DETAIL_SCSI_COMMAND_H
#define TAVO_STORAGE_DETAIL_SCSI_COMMAND_H

#include <array>
#include <cstdint>
#include <span>

namespace tavo {

enum class Transfer { none, from_disk, to_disk };

struct ScsiAnswer {
    bool delivered;  // the command reached the disk
    uint8_t status;  // 0 good, 2 check condition
    std::array<uint8_t, 32> sense;
};

// Waits at most a minute.
ScsiAnswer SendScsi(int fd, std::span<const uint8_t> command, Transfer transfer, std::span<uint8_t> data);

}  // namespace tavo

#endif
