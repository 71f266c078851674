// Checks whether a service is switched on.
#ifndef TAVO_SERVICE_DETAIL_SWITCHED_ON_H
#define TAVO_SERVICE_DETAIL_SWITCHED_ON_H

#include "tavo_service.h"

#include "core/detail/setting_switch.h"

namespace tavo {

// Returns whether the service's key switches it on. A service without a key is driven by others.
inline bool IsSwitchedOn(const TAVOSERVICE &service) noexcept
{
    return service.szKey && SettingSaysYes(kSettings, service.szKey);
}

}  // namespace tavo

#endif
