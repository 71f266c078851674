// Removes a member from an array.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/open_disk.h"
#include "storage/detail/partition_command.h"

namespace {

bool IsMember(int array, const char *member)
{
    const std::string leaf = "md/dev-" + std::string(tavo::WithoutDev(member));
    return tavo::HasNode(tavo::ArrayFile(array, leaf).c_str());
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
        tavo::CommandResult result =
            tavo::RunDiskCommand("/sbin/mdadm %s -r %s > /dev/null 2>&1", pInfo->szPath, szMember);
        // Some versions of mdadm take the short option for another one here, do nothing and call it success.
        if (result.status == 0 && IsMember(*array, szMember))
            result = tavo::RunDiskCommand("/sbin/mdadm --remove %s %s > /dev/null 2>&1", pInfo->szPath, szMember);
        if (result.status == 0 && !IsMember(*array, szMember))
            return 0;
        LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
        return -1;
    });
}
