// Sends an ATA command through the kernel's HDIO_DRIVE_CMD request.
#include "tavo_disk.h"

#include "core/detail/log.h"
#include "storage/detail/drive_page.h"

#include <array>
#include <cerrno>
#include <cstring>

#include <linux/hdreg.h>
#include <sys/ioctl.h>

namespace {

constexpr size_t kArguments = 4;

// The request's four bytes. For SMART the first number is the sector number and the second the sector count; for all
// others the first is the sector count, and the second how many sectors of data come back.
struct DriveCommand {
    unsigned char command;
    unsigned char first;
    unsigned char feature;
    unsigned char second;
    size_t returned;  // bytes of data
};

// clang-format off
constexpr DriveCommand kDriveCommands[] = {
    {0xB0, 1, 0xD8, 0, 0},                 // SMART ENABLE OPERATIONS
    {0xB0, 0, 0xD0, 1, tavo::kPageBytes},  // SMART READ DATA
    {0xB0, 1, 0xD1, 1, tavo::kPageBytes},  // SMART READ THRESHOLDS
    {0xB0, 6, 0xD5, 1, tavo::kPageBytes},  // SMART READ LOG, the self-test log
    {0xE5, 0, 0x00, 0, 0},                 // CHECK POWER MODE: the answer is a register
    {0x00, 0, 0x00, 0, 0},                 // the timer has no number here
    {0xE0, 0, 0x00, 0, 0},                 // STANDBY IMMEDIATE
    {0xEC, 1, 0x00, 1, tavo::kPageBytes},  // IDENTIFY DEVICE
    {0xA1, 1, 0x00, 1, tavo::kPageBytes},  // IDENTIFY PACKET DEVICE
};
// clang-format on
static_assert(std::size(kDriveCommands) == DISK_COMMAND_FLUSH);

// A packet device answers the one of the two that other devices refuse.
int SwapForPacketDevice(int fd, int command)
{
    hd_driveid identity = {};
    const bool packet = ::ioctl(fd, HDIO_GET_IDENTITY, &identity) == 0 && (identity.config & 0x8000) != 0;
    if (!packet)
        return command;
    return command == DISK_COMMAND_IDENTIFY ? DISK_COMMAND_IDENTIFY_PACKET : DISK_COMMAND_IDENTIFY;
}

int Refuse()
{
    LogError("%s:%d ata ioctl HDIO_DRIVE_CMD error \n");
    return -1;
}

}  // namespace

extern "C" int ata_command_interface(int fd, int nCommand, unsigned char *pData)
{
    if (nCommand == DISK_COMMAND_FLUSH)
        return ::ioctl(fd, HDIO_DRIVE_CMD, nullptr) == 0 || errno == EINVAL ? 0 : Refuse();
    if (nCommand < 0 || nCommand > DISK_COMMAND_FLUSH || nCommand == DISK_COMMAND_SET_TIMER)
        return -1;
    if (nCommand == DISK_COMMAND_IDENTIFY || nCommand == DISK_COMMAND_IDENTIFY_PACKET)
        nCommand = SwapForPacketDevice(fd, nCommand);
    const DriveCommand &row = kDriveCommands[nCommand];
    const bool returns_register = nCommand == DISK_COMMAND_CHECK_POWER;
    if (!pData && (row.returned || returns_register))
        return -1;
    std::array<unsigned char, kArguments + tavo::kPageBytes> buffer = {row.command, row.first, row.feature, row.second};
    if (::ioctl(fd, HDIO_DRIVE_CMD, buffer.data()) != 0)
        return Refuse();
    if (returns_register)
        pData[0] = buffer[2];  // status, error, sector count
    else if (row.returned)
        std::memcpy(pData, buffer.data() + kArguments, row.returned);
    return 0;
}
