// Tunes an array for the appliance.
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"

#include <memory>

extern "C" int TAVORAIDMdTuningPerformance(const char *szPath)
{
    constexpr int entries = 1024;
    if (!tavo::IsArrayPath(szPath)) {
        LogError("%s:%d illegal device path: %s ", szPath ? szPath : "NULL");
        return Fail(ERR_BAD_PARAMETERS);
    }
    RAIDINFO *info = nullptr;
    const int result = RAIDInfoGet(szPath, &info);
    const std::unique_ptr<RAIDINFO, decltype(&RAIDInfoFree)> owner(info, RAIDInfoFree);
    if (result != 1) {
        LogError("%s:%d Failed to get RAID information %s", szPath);
        return -1;
    }
    if (info->fLevel != RAID_LEVEL_5 && info->fLevel != RAID_LEVEL_6)
        return 0;
    return TAVORAIDMdStripeCacheSizeSet(szPath, entries);
}
