// Checks whether an interface wakes the appliance.
#include "tavo_net.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/wake_on_lan.h"

extern "C" int TAVONetWolGet(const char *szInterface)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (!tavo::IsWakeOnLanSupported()) {
            LogError("%s:%d Wake-on-lan isn't supported.");
            return Fail(ERR_OP_UNREGISTERED);
        }
        // The panel's controller cannot be queried, so the last setting is stored.
        if (tavo::IsWokenByPanel()) {
            const std::string told = tavo::ReadSetting(tavo::kSettings, tavo::WakeOptionsKey(szInterface).c_str());
            return tavo::ParseWakeOptions(told).value_or(0) != 0 ? 1 : 0;
        }
        const auto wake = tavo::GetWakeSettings(szInterface);
        if (!wake) {
            LogError("%s:%d Cannot get current wake-on-lan settings");
            return Fail(ERR_OP_FAILURE);
        }
        return wake->enabled != 0 ? 1 : 0;
    });
}
