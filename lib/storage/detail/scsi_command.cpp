// One SCSI command to an open disk.
#include "storage/detail/scsi_command.h"

#include <algorithm>

#include <scsi/sg.h>
#include <sys/ioctl.h>

namespace tavo {
namespace {

constexpr unsigned kTimeout = 60000;  // milliseconds: a disk may have to spin up first
constexpr size_t kLongestCommand = 16;

int DirectionOf(Transfer transfer)
{
    switch (transfer) {
    case Transfer::from_disk:
        return SG_DXFER_FROM_DEV;
    case Transfer::to_disk:
        return SG_DXFER_TO_DEV;
    case Transfer::none:
        break;
    }
    return SG_DXFER_NONE;
}

}  // namespace

ScsiAnswer SendScsi(int fd, std::span<const uint8_t> command, Transfer transfer, std::span<uint8_t> data)
{
    ScsiAnswer answer = {};
    std::array<uint8_t, kLongestCommand> bytes = {};
    std::copy(command.begin(), command.end(), bytes.begin());
    sg_io_hdr_t request = {};
    request.interface_id = 'S';
    request.dxfer_direction = DirectionOf(transfer);
    request.cmdp = bytes.data();
    request.cmd_len = static_cast<unsigned char>(command.size());
    request.sbp = answer.sense.data();
    request.mx_sb_len = static_cast<unsigned char>(answer.sense.size());
    request.dxferp = data.data();
    request.dxfer_len = static_cast<unsigned>(data.size());
    request.timeout = kTimeout;
    if (::ioctl(fd, SG_IO, &request) != 0)
        return answer;
    answer.delivered = request.host_status == 0;
    answer.status = request.status;
    return answer;
}

}  // namespace tavo
