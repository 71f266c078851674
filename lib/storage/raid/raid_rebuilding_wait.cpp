// Waits until an array is no longer being rebuilt.
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"

#include <memory>

#include <unistd.h>

namespace {

constexpr int kPollSeconds = 30;
constexpr int kMostFailures = 4;
constexpr int kMostExtraRounds = 6;

// Returns true when all members are present but the array is degraded: a rebuild is about to start.
bool IsAboutToRebuild(const RAIDINFO &info)
{
    return info.nWorking == info.nSlot - info.nFailed && info.nStatus == RAID_STATUS_DEGRADED;
}

}  // namespace

extern "C" int RAIDRebuildingWait(const char *szPath)
{
    if (!tavo::IsArrayPath(szPath))
        return Fail(ERR_BAD_PARAMETERS);
    int failures = 0;
    for (int extra_rounds = 0;; ::sleep(kPollSeconds)) {
        RAIDINFO *info = nullptr;
        const int result = RAIDInfoGet(szPath, &info);
        const std::unique_ptr<RAIDINFO, decltype(&RAIDInfoFree)> owner(info, RAIDInfoFree);
        if (result != 1) {
            if (++failures <= kMostFailures)
                continue;
            LogError("%s:%d Failed to get %s info, error=[0x%X], return=%d, retry=%d", szPath, TLIBErrGet(), result,
                     failures);
            return -1;
        }
        failures = 0;
        if (info->fRebuilding || (IsAboutToRebuild(*info) && extra_rounds++ < kMostExtraRounds))
            continue;
        if (info->nStatus == RAID_STATUS_NORMAL)
            return 0;
        LogDebug("%s:%d %s build error, status is %d, rebuilding: %d", szPath, info->nStatus, info->fRebuilding);
        return -1;
    }
}
