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

// The kernel name.
tavo::Result<std::string> FindDisk(int number)
{
    tavo::PartitionsFile file;
    for (tavo::PartitionsRow row; file.NextRow(row);) {
        const bool whole = row.IsWholeIdeDisk() || row.IsWholeScsiDisk();
        if (whole && row.DeviceNumber() == number && tavo::IsDeviceName(row.name))
            return std::string(row.name);
    }
    return file.Failure() ? file.Failure() : tavo::Code(ERR_NO_DISK_ID);
}

}  // namespace

extern "C" int TAVODiskGetInfo(int nKind, int nDevice, TAVODISKINFO **ppInfo)
{
    if (nKind != 1 || !ppInfo)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const tavo::Result<std::string> name = FindDisk(nDevice);
        if (!name)
            return Fail(name.Failure());
        uint64_t bytes = 0;
        const tavo::Fd disk = tavo::OpenFd(("/dev/" + *name).c_str(), O_RDONLY);
        if (!disk || !tavo::AskSize(disk, bytes))
            return Fail(ERR_DISK_IO_FAILED);
        tavo::HeapBlock<TAVODISKINFO> info(static_cast<TAVODISKINFO *>(std::calloc(1, sizeof(TAVODISKINFO))));
        if (!info)
            return Fail(ERR_NOT_ENOUGH_MEMORY);
        info->nDevice = nDevice;
        name->copy(info->szName, sizeof info->szName - 1);
        info->nKind = kDiskKind;
        info->cMibDisk = bytes >> 20;
        *ppInfo = info.Release();
        return 0;
    });
}
