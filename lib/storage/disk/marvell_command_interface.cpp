// Sends an ATA command in SCSI wrapping, for controllers that do not take HDIO_DRIVE_CMD.
#include "tavo_disk.h"

#include "core/detail/log.h"
#include "storage/detail/ata_pass_through.h"
#include "storage/detail/drive_page.h"

namespace {

constexpr unsigned char kSmartMid = 0x4F;  // without these two a drive takes no SMART command
constexpr unsigned char kSmartHigh = 0xC2;

// clang-format off
constexpr tavo::AtaCommand kTaskCommands[] = {
    {0xB0, 0xD8, 0, 1, kSmartMid, kSmartHigh},  // SMART ENABLE OPERATIONS
    {0xB0, 0xD0, 1, 0, kSmartMid, kSmartHigh},  // SMART READ DATA
    {0xB0, 0xD1, 1, 1, kSmartMid, kSmartHigh},  // SMART READ THRESHOLDS
    {0xB0, 0xD5, 1, 6, kSmartMid, kSmartHigh},  // SMART READ LOG, the self-test log
    {0xE5},                                     // CHECK POWER MODE
    {0xE3},                                     // IDLE: sets the timer
    {0xE0},                                     // STANDBY IMMEDIATE
    {0xEC, 0, 1},                               // IDENTIFY DEVICE
    {0xA1, 0, 1},                               // IDENTIFY PACKET DEVICE
    {0xE7},                                     // FLUSH CACHE
};
// clang-format on
static_assert(std::size(kTaskCommands) == DISK_COMMAND_FLUSH + 1);

constexpr bool ReturnsPage(int command)
{
    return command == DISK_COMMAND_SMART_DATA || command == DISK_COMMAND_SMART_THRESHOLDS ||
           command == DISK_COMMAND_SMART_SELFTEST || command == DISK_COMMAND_IDENTIFY ||
           command == DISK_COMMAND_IDENTIFY_PACKET;
}

}  // namespace

extern "C" int marvell_command_interface(int fd, int nCommand, unsigned char *pData)
{
    if (nCommand < 0 || nCommand > DISK_COMMAND_FLUSH)
        return -1;
    const bool page = ReturnsPage(nCommand);
    const bool one_byte = nCommand == DISK_COMMAND_CHECK_POWER || nCommand == DISK_COMMAND_SET_TIMER;
    if (!pData && (page || one_byte))
        return -1;
    tavo::AtaCommand command = kTaskCommands[nCommand];
    if (nCommand == DISK_COMMAND_SET_TIMER)
        command.count = pData[0];
    tavo::AtaResult result = {};
    tavo::DrivePage answer = {};
    const std::span<uint8_t> room = page ? std::span<uint8_t>(answer) : std::span<uint8_t>();
    if (!tavo::PassThrough(fd, command, room, result)) {
        LogError("%s:%d ATA command 0x%02X failed", command.command);
        return -1;
    }
    if (page)
        std::copy(answer.begin(), answer.end(), pData);
    else if (nCommand == DISK_COMMAND_CHECK_POWER)
        pData[0] = result.count;
    return 0;
}
