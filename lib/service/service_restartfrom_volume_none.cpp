// Restarts the enabled services that had no volume, after the first one appeared.
#include "tavo_service.h"

#include "core/detail/log.h"
#include "service/detail/service_table.h"
#include "service/detail/switched_on.h"

#include <algorithm>

extern "C" int TAVOServiceRestartfromVolumeNone(void)
{
    int restarted = 0;
    for (int id = 0; id < tavo::kServices; ++id) {
        const TAVOSERVICE &service = tavo::service_table[id];
        const auto shares = tavo::SharesOf(service);
        const bool adrift = std::any_of(shares.begin(), shares.end(), [](int32_t share) {
            TAVOSERVICESHARE record;
            return TAVOServiceSettingGet(share, &record) == 0;
        });
        if (!adrift || !tavo::IsSwitchedOn(service))
            continue;
        if (TAVOServiceActionSet(id, TAVO_SERVICE_ENABLE) == 0)
            ++restarted;
        else
            LogError("%s:%d Failed to restart service %s", service.szName);
    }
    return restarted;
}
