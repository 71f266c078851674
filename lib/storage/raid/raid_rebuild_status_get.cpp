// Asks the appliance's driver how far a rebuild has come.
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/array_members.h"

#include <cerrno>
#include <cstring>

extern "C" int RAIDRebuildStatusGet(int fd, RAIDPROGRESS *pProgress)
{
    if (fd < 0 || !pProgress)
        return Fail(ERR_BAD_PARAMETERS);
    RAIDPROGRESS answer = {};
    if (::ioctl(fd, tavo::kSyncStatusRequest, &answer) != 0) {
        if (errno == ENODEV)
            return Fail(ERR_PATH_NOT_FOUND);
        LogError("%s:%d Failed to ioctl for sync status, errno=%s", std::strerror(errno));
        return Fail(ERR_UNKNOWN);
    }
    if (answer.nState != 0)
        answer.nState = answer.cDone == 0 ? 2 : 1;
    *pProgress = answer;
    return 0;
}
