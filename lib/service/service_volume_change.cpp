// Binds a service's data folder to another volume and restarts the services that use it.
#include "tavo_service.h"

#include "core/detail/log.h"
#include "service/detail/service_table.h"
#include "service/detail/switched_on.h"

extern "C" int TAVOServiceVolumeChange(int idShare, const char *szVolume)
{
    if (TAVOServiceSet(idShare, szVolume) != 0)
        return -1;
    int result = 0;
    for (int id = 0; id < tavo::kServices; ++id) {
        const TAVOSERVICE &service = tavo::service_table[id];
        if (!tavo::UsesShare(service, idShare) || !tavo::IsSwitchedOn(service))
            continue;
        if (TAVOServiceActionSet(id, TAVO_SERVICE_RESTART) != 0) {
            LogError("%s:%d Failed to restart service %s", service.szName);
            result = -1;
        }
    }
    return result;
}
