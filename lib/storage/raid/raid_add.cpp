// Adds a member to an array.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/partition_command.h"

extern "C" int RAIDAdd(const RAIDINFO *pInfo, const char *szMember)
{
    if (!pInfo || !tavo::IsArrayPath(pInfo->szPath) || !tavo::IsMemberPath(szMember)) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        tavo::CheckedFormat<tavo::ArgKind::text, tavo::ArgKind::text> format = "/sbin/mdadm %s -a %s > /dev/null 2>&1";
        switch (pInfo->fLevel) {
        case RAID_LEVEL_1:
        case RAID_LEVEL_5:
        case RAID_LEVEL_6:
        case RAID_LEVEL_10:
            break;
        case RAID_LEVEL_LINEAR:
            format = "/sbin/mdadm --grow %s -a %s > /dev/null 2>&1";
            break;
        default:
            LogError("%s:%d Bad raid level to add disk: %d", pInfo->fLevel);
            return -1;
        }
        std::string beyond = tavo::DeviceBeyondReach(szMember);
        if (beyond.empty() && pInfo->fLevel == RAID_LEVEL_LINEAR)
            beyond = tavo::LongerArrayBeyondReach(pInfo->szPath, szMember);
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        const int status = tavo::RunDiskCommand(format, pInfo->szPath, szMember).status;
        if (status == 0)
            return 0;
        LogError("%s:%d Failed to add '%s' into '%s', WEXITSTATUS(err) = %d, err = %d", szMember, pInfo->szPath, status,
                 status < 0 ? status : status * 256);
        return -1;
    });
}
