// ATA commands in SCSI wrapping, for controllers that take no raw ones.
#ifndef TAVO_STORAGE_DETAIL_ATA_PASS_THROUGH_H
#define TAVO_STORAGE_DETAIL_ATA_PASS_THROUGH_H

#include "storage/detail/scsi_command.h"

#include <array>
#include <cstdint>
#include <optional>
#include <span>

namespace tavo {

struct AtaCommand {
    uint8_t command;
    uint8_t feature = 0;
    uint8_t count = 0;
    uint8_t lba_low = 0;
    uint8_t lba_mid = 0;
    uint8_t lba_high = 0;
};

// The drive's registers after the command.
struct AtaResult {
    uint8_t error;
    uint8_t count;
    uint8_t status;
};

// The wrapping of 16 and of 12 bytes. `reads` tells whether 512 bytes come back.
std::array<uint8_t, 16> WrapIn16(const AtaCommand &command, bool reads);
std::array<uint8_t, 12> WrapIn12(const AtaCommand &command, bool reads);

// Finds the registers in sense data of either format.
std::optional<AtaResult> ParseAtaResult(std::span<const uint8_t> sense);

// Sends it, in the longer wrapping first. False when the drive did not carry it out.
bool PassThrough(int fd, const AtaCommand &command, std::span<uint8_t> data, AtaResult &result);

}  // namespace tavo

#endif
