// Removes a member from an array.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/member_node.h"
#include "storage/detail/open_disk.h"
#include "storage/detail/partition_command.h"

namespace {

using tavo::CommandResult;

// A disk that was pulled while nothing was written is in order for md, which removes only failed members and spares.
CommandResult RemoveByName(const char *array, int number, std::string_view name)
{
    if (!tavo::IsFaulty(number, name))
        tavo::RunDiskCommand("/sbin/mdadm %s -f %s > /dev/null 2>&1", array, name);
    return tavo::RunDiskCommand("/sbin/mdadm --remove %s %s > /dev/null 2>&1", array, name);
}

}  // namespace

extern "C" int RAIDRemoveDisk(const RAIDINFO *pInfo, const char *szMember)
{
    const auto array = pInfo ? tavo::ArrayNumber(pInfo->szPath) : std::nullopt;
    if (!array || !tavo::IsMemberPath(szMember)) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        const std::string_view name = tavo::WithoutDev(szMember);
        const bool pulled = !tavo::HasNode(szMember);
        CommandResult result = tavo::RunDiskCommand("/sbin/mdadm %s -r %s > /dev/null 2>&1", pInfo->szPath, szMember);
        // Some versions of mdadm take the short option for another one here, do nothing and call it success.
        if ((result.status == 0 || pulled) && tavo::IsMemberName(*array, name))
            result = tavo::RunDiskCommand("/sbin/mdadm --remove %s %s > /dev/null 2>&1", pInfo->szPath, szMember);
        // A path without a node says nothing to mdadm; the kernel's name does.
        if (pulled && tavo::IsMemberName(*array, name))
            result = RemoveByName(pInfo->szPath, *array, name);
        if (result.status == 0 && !tavo::IsMemberName(*array, name))
            return 0;
        LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
        return -1;
    });
}
