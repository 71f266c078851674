// Removes a file.
#include "tavo_proc.h"

#include "core/detail/fault.h"

#include <cerrno>

#include <unistd.h>

extern "C" int TLIBSysRemove(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    if (::unlink(szPath) == 0)
        return 0;
    switch (errno) {
    case ENOENT:
        return Fail(ERR_FILE_NOT_FOUND);
    case EACCES:
    case EPERM:
    case EROFS:
        return Fail(ERR_ACCESS_DENIED);
    default:
        return Fail(ERR_SYS_UNKNOWN);
    }
}
