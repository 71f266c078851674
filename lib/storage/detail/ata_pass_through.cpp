// ATA commands in SCSI wrapping.
#include "storage/detail/ata_pass_through.h"

namespace tavo {
namespace {

constexpr uint8_t kPassThrough16 = 0x85;
constexpr uint8_t kPassThrough12 = 0xA1;

constexpr uint8_t kNoData = 3 << 1;  // the protocol field
constexpr uint8_t kDataIn = 4 << 1;

constexpr uint8_t kReturnRegisters = 0x20;   // the answer comes as a check condition, good or bad
constexpr uint8_t kReadsCountBlocks = 0x0E;  // from the drive, in blocks, as many as the count field says

constexpr uint8_t kCheckCondition = 2;

constexpr uint8_t kNoStandby = 0xFF;
constexpr uint8_t kIllegalRequest = 5;
constexpr uint8_t kDriveBusyOrFailed = 0x80 | 0x20 | 0x01;

uint8_t SenseKey(std::span<const uint8_t> sense)
{
    const bool descriptors = (sense[0] & 0x7F) >= 0x72;
    return sense[descriptors ? 1 : 2] & 0x0F;
}

uint8_t FlagsOf(bool reads)
{
    return reads ? kReadsCountBlocks : kReturnRegisters;
}

}  // namespace

std::array<uint8_t, 16> WrapIn16(const AtaCommand &command, bool reads)
{
    return {kPassThrough16,   reads ? kDataIn : kNoData,
            FlagsOf(reads),   0,
            command.feature,  0,
            command.count,    0,
            command.lba_low,  0,
            command.lba_mid,  0,
            command.lba_high, 0,
            command.command,  0};
}

std::array<uint8_t, 12> WrapIn12(const AtaCommand &command, bool reads)
{
    return {kPassThrough12,
            reads ? kDataIn : kNoData,
            FlagsOf(reads),
            command.feature,
            command.count,
            command.lba_low,
            command.lba_mid,
            command.lba_high,
            0,
            command.command};
}

std::optional<AtaResult> ParseAtaResult(std::span<const uint8_t> sense)
{
    if (sense.size() < 22)
        return std::nullopt;
    const uint8_t format = sense[0] & 0x7F;
    if (format == 0x72 && sense[8] == 0x09)
        return AtaResult{.error = sense[11], .count = sense[13], .status = sense[21]};
    // The fixed format has no descriptors: the information field carries the registers.
    if (format == 0x70)
        return AtaResult{.error = sense[3], .count = sense[6], .status = sense[4]};
    return std::nullopt;
}

bool PassThrough(int fd, const AtaCommand &command, std::span<uint8_t> data, AtaResult &result)
{
    const bool reads = !data.empty();
    const Transfer transfer = reads ? Transfer::from_disk : Transfer::none;
    ScsiAnswer answer = SendScsi(fd, WrapIn16(command, reads), transfer, data);
    if (answer.delivered && answer.status == kCheckCondition && SenseKey(answer.sense) == kIllegalRequest)
        answer = SendScsi(fd, WrapIn12(command, reads), transfer, data);
    if (!answer.delivered)
        return false;
    result = {.error = 0, .count = kNoStandby, .status = 0};
    if (answer.status == 0)
        return true;  // some bridges keep the registers to themselves
    const std::optional<AtaResult> registers = ParseAtaResult(answer.sense);
    if (answer.status != kCheckCondition || !registers || SenseKey(answer.sense) > 1)
        return false;
    result = *registers;
    return (result.status & kDriveBusyOrFailed) == 0;
}

}  // namespace tavo
