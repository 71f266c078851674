// Opens a disk for raw commands.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "storage/detail/raw_disk.h"

extern "C" int TAVOIDiskRawOpen(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    tavo::Fd disk;
    if (const tavo::Code code = tavo::OpenRawDisk(szPath, disk))
        return Fail(code);
    return disk.Release();
}
