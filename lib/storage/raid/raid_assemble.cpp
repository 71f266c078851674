// Starts an array from the members that carry its UUID.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/mdadm_examine.h"
#include "storage/detail/partition_command.h"
#include "storage/detail/unfinished_array.h"

extern "C" int RAIDAssemble(const char *szPath, const char *szUuid)
{
    const auto number = szPath ? tavo::ArrayNumber(szPath) : std::nullopt;
    if (!number || !szUuid || !tavo::IsArrayUuid(szUuid)) {
        LogError("%s:%d Bad parameters");
        return Fail(ERR_BAD_PARAMETERS);
    }
    return Guard([&] {
        const auto result = tavo::RunDiskCommand("/sbin/mdadm -A %s -u %s > /dev/null 2>&1", szPath, szUuid);
        if (result.status == 0) {
            tavo::GoOnWithArray(*number);
            return 0;
        }
        LogError("%s:%d Failed to do '%s', err=%d", result.command, result.status);
        return -1;
    });
}
