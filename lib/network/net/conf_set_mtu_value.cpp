// Stores the MTU of an interface; it takes effect when the interface is next configured.
#include "tavo_file.h"
#include "tavo_net.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/fault.h"
#include "core/detail/lock_hold.h"
#include "core/detail/log.h"
#include "network/detail/interface_name.h"
#include "network/detail/mtu_setting.h"

extern "C" int TAVOConfSetMTUValue(const char *szInterface, int mtu)
{
    if (!szInterface || !tavo::IsMtu(mtu))
        return Fail(ERR_BAD_PARAMETERS);
    if (!tavo::IsInterfaceName(szInterface)) {
        LogError("%s:%d interface name is too long");
        return Fail(ERR_BAD_PARAMETERS);
    }
    const tavo::LockHold lock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 5);
    if (!lock) {
        LogError("%s (%d) Failed to lock tavoinfo(%X)", TLIBErrGet());
        return Fail(ERR_LOCK_FAILED);
    }
    char value[16];
    std::snprintf(value, sizeof value, "%d", mtu);
    if (TLIBFileSetKeyValue(tavo::kSettings, tavo::MtuKey(szInterface).text, value, nullptr) < 0)
        return Fail(TLIBErrGet());
    return 0;
}
