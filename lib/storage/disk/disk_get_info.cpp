// Reads the summary of the disk with a device number.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/owner.h"
#include "storage/detail/device_name.h"
#include "storage/detail/disk_size.h"
#include "storage/detail/proc_partitions.h"

#include <string>

namespace {

constexpr int32_t kDiskKind = 7;

// The kernel name; empty with the code when there is no such disk.
std::string FindDisk(int number, int &code)
{
    tavo::PartitionsFile file;
    for (tavo::PartitionsRow row; file.NextRow(row);) {
        const bool whole = row.IsWholeIdeDisk() || row.IsWholeScsiDisk();
        if (whole && row.DeviceNumber() == number && tavo::IsDeviceName(row.name))
            return std::string(row.name);
    }
    code = file.Code() ? file.Code() : int{ERR_NO_DISK_ID};
    return {};
}

}  // namespace

extern "C" int TAVODiskGetInfo(int nKind, int nDevice, TAVODISKINFO **ppInfo)
{
    if (nKind != 1 || !ppInfo)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        int code = 0;
        const std::string name = FindDisk(nDevice, code);
        if (name.empty())
            return Fail(code);
        uint64_t bytes = 0;
        const tavo::Fd disk = tavo::OpenFd(("/dev/" + name).c_str(), O_RDONLY);
        if (!disk || !tavo::AskSize(disk, bytes))
            return Fail(ERR_DISK_IO_FAILED);
        tavo::HeapBlock<TAVODISKINFO> info(static_cast<TAVODISKINFO *>(std::calloc(1, sizeof(TAVODISKINFO))));
        if (!info)
            return Fail(ERR_NOT_ENOUGH_MEMORY);
        info->nDevice = nDevice;
        name.copy(info->szName, sizeof info->szName - 1);
        info->nKind = kDiskKind;
        info->cMibDisk = bytes >> 20;
        *ppInfo = info.Release();
        return 0;
    });
}
