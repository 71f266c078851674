// Stops or starts every enabled service without changing keys.
#include "tavo_service.h"

#include "core/detail/log.h"
#include "service/detail/service_table.h"
#include "service/detail/switched_on.h"

extern "C" int TAVOServiceOnOffALL(int fOn)
{
    int switched = 0;
    for (int step = 0; step < tavo::kServices; ++step) {
        const int id = fOn ? step : tavo::kServices - 1 - step;
        const TAVOSERVICE &service = tavo::service_table[id];
        if (!tavo::IsSwitchedOn(service))
            continue;
        if (TAVOServiceActionSet(id, fOn ? TAVO_SERVICE_START : TAVO_SERVICE_STOP) == 0)
            ++switched;
        else
            LogError("%s:%d Failed to switch service %s", service.szName);
    }
    return switched;
}
