// Adds a member that is large enough.
#include "tavo_disk.h"
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/member_size.h"

extern "C" int RAIDAddRobustCheck(const RAIDINFO *pInfo, const char *szMember)
{
    if (!pInfo || !tavo::IsMemberPath(szMember))
        return Fail(ERR_BAD_PARAMETERS);
    uint64_t sectors = 0;
    const int result = DiskSizeGet(szMember, &sectors);
    if (result != 1)
        return Fail(result == 0 ? ERR_PATH_NOT_FOUND : ERR_SYS_UNKNOWN);
    if (!tavo::HoldsMember(*pInfo, sectors)) {
        LogError("%s:%d '%s' is too small for '%s'", szMember, pInfo->szPath);
        return Fail(ERR_NOT_ENOUGH_SPACE);
    }
    return RAIDAdd(pInfo, szMember) == 0 ? 0 : Fail(ERR_SYS_UNKNOWN);
}
