// Erases the superblock of a member.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/partition_command.h"

extern "C" int RAIDSBClean(const char *szMember)
{
    if (!tavo::IsMemberPath(szMember))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const auto result = tavo::RunDiskCommand("/sbin/mdadm --zero-superblock %s > /dev/null 2>&1", szMember);
        if (result.status == 0)
            return 0;
        LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
        return -1;
    });
}
