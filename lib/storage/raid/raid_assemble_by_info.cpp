// Starts an array from the members of its record.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/partition_command.h"

extern "C" int RAIDAssembleByInfo(const RAIDINFO *pInfo)
{
    bool good = pInfo && tavo::IsArrayPath(pInfo->szPath) && pInfo->pMembers;
    for (const RAIDMEMBER *member = good ? pInfo->pMembers : nullptr; member; member = member->pNext)
        good = good && tavo::IsMemberPath(member->szPath);
    if (!good) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        std::string members;
        for (const RAIDMEMBER *member = pInfo->pMembers; member; member = member->pNext)
            members.append(" ").append(member->szPath);
        const auto result =
            tavo::RunDiskCommand("/sbin/mdadm -A %s%s > /dev/null 2>&1", pInfo->szPath, tavo::ComposedPiece{members});
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
        return -1;
    });
}
