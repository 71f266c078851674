// Lists the device numbers of all whole disks.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "storage/detail/proc_partitions.h"

#include <algorithm>
#include <vector>

extern "C" int TAVODiskEnum(int nKind, int32_t **ppNumber)
{
    if (nKind != 1 || !ppNumber)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        std::vector<int32_t> ide;
        std::vector<int32_t> scsi;
        tavo::PartitionsFile file;
        for (tavo::PartitionsRow row; file.NextRow(row);) {
            if (row.IsWholeIdeDisk())
                ide.push_back(row.DeviceNumber());
            else if (row.IsWholeScsiDisk())
                scsi.push_back(row.DeviceNumber());
        }
        if (const tavo::Code code = file.Failure())
            return Fail(code);
        const size_t count = ide.size() + scsi.size();
        int32_t *numbers = nullptr;
        if (count > 0) {
            numbers = static_cast<int32_t *>(std::malloc(count * sizeof *numbers));
            if (!numbers)
                return Fail(ERR_OUT_OF_MEMORY);
            std::copy(scsi.begin(), scsi.end(), std::copy(ide.begin(), ide.end(), numbers));
        }
        *ppNumber = numbers;
        return static_cast<int>(count);
    });
}
