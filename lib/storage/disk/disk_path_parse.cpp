// Takes the path of a disk apart.
#include "tavo_disk.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/disk_path.h"

extern "C" int DiskPathParse(const char *szPath, DISKPATH *pParsed)
{
    using Outcome = tavo::ParsedDiskPath::Outcome;
    if (!szPath || !pParsed)
        return Fail(ERR_BAD_PARAMETERS);
    const tavo::ParsedDiskPath parsed = tavo::ParseDiskPath(szPath);
    if (parsed.outcome == Outcome::no_disk) {
        LogError("%s:%d bad paramters: disk path: %s", szPath);
        return -1;
    }
    if (parsed.outcome == Outcome::bad_tail) {
        LogError("%s:%d bad paramters: disk path: %s, ptr = %c", szPath, std::string_view(parsed.tail, 1));
        return -1;
    }
    *pParsed = parsed.path;
    return 0;
}
