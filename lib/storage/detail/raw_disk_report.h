// How an exported function works on a raw disk and reports one that cannot be opened, under its own module name.
#ifndef TAVO_STORAGE_DETAIL_RAW_DISK_REPORT_H
#define TAVO_STORAGE_DETAIL_RAW_DISK_REPORT_H

#include "core/detail/guard.h"
#include "core/detail/result.h"
#include "storage/detail/raw_disk.h"

namespace tavo {

// Returns the result of the body for the open disk; -1 with a code of OpenRawDisk.
template <class Body>
int WithRawDisk(const char *path, Body &&body, Where where = Where())
{
    const auto open_first = [&]() -> int {
        RawDisk disk;
        if (const Code code = disk.Open(path))
            return Fail(code, where);
        return body(disk);
    };
    return Guard(open_first, ERR_OUT_OF_MEMORY, where);
}

}  // namespace tavo

#endif
