// Reads an array's UUID.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "storage/detail/mdadm_examine.h"

#include <cstring>
#include <memory>

extern "C" int RAIDUUIDGet(const char *szPath, char *szUuid, int cbUuid)
{
    if (!szUuid || cbUuid < 1)
        return Fail(ERR_BAD_PARAMETERS);
    RAIDINFO *info = nullptr;
    const int result = RAIDInfoGet(szPath, &info);
    const std::unique_ptr<RAIDINFO, decltype(&RAIDInfoFree)> owner(info, RAIDInfoFree);
    if (result != 1)
        return result;
    for (const RAIDMEMBER *member = info->pMembers; member; member = member->pNext) {
        RAIDSUPERBLOCK superblock;
        if (RAIDSBGet(member->szPath, &superblock) != 1 || !tavo::IsArrayUuid(superblock.szUuid))
            continue;
        const size_t bytes = std::strlen(superblock.szUuid) + 1;
        if (bytes > static_cast<size_t>(cbUuid))
            return Fail(ERR_NOT_ENOUGH_MEMORY);
        std::memcpy(szUuid, superblock.szUuid, bytes);
        return 1;
    }
    return 0;
}
