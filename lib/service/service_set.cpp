// Binds a service's data folder to a volume: the share, then the link.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "service/detail/volume_list.h"

#include <climits>

extern "C" int TAVOServiceSet(int idShare, const char *szVolume)
{
    char path[PATH_MAX];

    if (TAVOServiceShareGen(idShare, szVolume, path, sizeof path) < 0)
        return -1;  // with its code
    return Guard([&] {
        // Callers bind services before the volume is mounted, so this is not refused. But data that is written until
        // then fills the system's own disk and disappears under the mount.
        if (tavo::VolumeType(szVolume) < 0)
            LogError("%s:%d %s is not mounted: %s is on the system disk", szVolume, path);
        if (TAVOServiceShareCreate(idShare, szVolume) != 0)
            return -1;
        return TAVOServiceLinkSet(idShare, path);
    });
}
