// Checks whether a disk can be opened.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "core/detail/open_file.h"

extern "C" int DiskIsExist(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::OpenFd(szPath, O_RDONLY) ? 1 : 0;
}
