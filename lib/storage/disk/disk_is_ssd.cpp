// Checks whether a drive has no rotating medium.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/raw_disk.h"

extern "C" int TAVODiskIsSSD(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::RawDisk disk;
        tavo::DrivePage identity = {};
        if (!disk.OpenToRead(szPath) || disk.Command(DISK_COMMAND_IDENTIFY, identity.data()) != 0) {
            LogError("%s:%d Failed to read the identification of %s", szPath);
            return -1;
        }
        return tavo::HasNoRotatingMedium(identity) ? 1 : 0;
    });
}
