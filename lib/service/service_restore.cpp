// Binds the services to a volume that has come back, and starts them.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "service/detail/data_folder.h"
#include "service/detail/service_table.h"
#include "service/detail/switched_on.h"
#include "service/detail/volume_list.h"

#include <climits>

namespace {

// Links the folders on the volume again; a link that leads to another volume by now is kept.
int BindAgain(const TAVOSERVICE &service, const char *volume)
{
    int bound = 0;
    for (const int32_t id : tavo::SharesOf(service)) {
        TAVOSERVICESHARE share;
        char path[PATH_MAX];
        if (TAVOServiceSettingGet(id, &share) == 1 && tavo::VolumeOf(share.szVolume) != volume)
            continue;
        if (TAVOServiceShareGen(id, volume, path, sizeof path) > 0 && tavo::IsRealFolder(path) &&
            TAVOServiceSet(id, volume) == 0)
            ++bound;
    }
    return bound;
}

}  // namespace

extern "C" int TAVOServiceRestore(const char *szVolume)
{
    if (!szVolume || !tavo::VolumeNumber(szVolume))
        return Fail(ERR_BAD_PARAMETERS);
    int bound = 0;
    for (int id = 0; id < tavo::kServices; ++id) {
        const TAVOSERVICE &service = tavo::service_table[id];
        if (!tavo::IsSwitchedOn(service))
            continue;
        const int here = BindAgain(service, szVolume);
        bound += here;
        if (here > 0 && TAVOServiceActionSet(id, TAVO_SERVICE_START) != 0)
            LogError("%s:%d Failed to start service %s", service.szName);
    }
    return bound;
}
