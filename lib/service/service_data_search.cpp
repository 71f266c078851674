// Searches the mounted volumes for a service's data folder.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "service/detail/data_folder.h"
#include "service/detail/volume_list.h"

#include <climits>
#include <cstdio>

extern "C" int TAVOServiceDataSearch(int idShare, char *szVolume, int cbVolume)
{
    char path[PATH_MAX];

    if (!szVolume || TAVOServiceShareGen(idShare, "/volume1", path, sizeof path) < 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        for (const tavo::Volume &volume : tavo::MountedVolumes()) {
            if (TAVOServiceShareGen(idShare, volume.path.c_str(), path, sizeof path) < 0 || !tavo::IsRealFolder(path))
                continue;
            if (volume.path.size() >= static_cast<size_t>(cbVolume < 0 ? 0 : cbVolume))
                return Fail(ERR_BAD_PARAMETERS);
            std::snprintf(szVolume, static_cast<size_t>(cbVolume), "%s", volume.path.c_str());
            return volume.number;
        }
        return 0;
    });
}
