// Removes an array.
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"

extern "C" int RAIDRemove(const RAIDINFO *pInfo)
{
    if (!pInfo || !tavo::IsArrayPath(pInfo->szPath)) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    char uuid[sizeof RAIDSUPERBLOCK::szUuid];
    const bool found = RAIDUUIDGet(pInfo->szPath, uuid, sizeof uuid) == 1;
    if (RAIDStop(pInfo->szPath) != 0)
        return -1;
    if (!found)
        return 0;
    LogError("%s:%d [Info] clean RAID superblock of %s", pInfo->szPath);
    return RAIDSBCleanByUUID(pInfo, uuid);
}
