// Brings /etc/hosts up to date after an address has changed: for the hook of the DHCP client.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/network_change.h"

extern "C" int TAVONetHostsRefresh(void)
{
    return Guard([] {
        // Never waits: whoever holds the lock may be waiting for the client whose hook this is.
        const tavo::LockHold lock(tavo::kNetworkExclusive, 0);
        if (!lock)
            return TLIBErrGet() == ERR_LOCK_FAILED ? 1 : Fail(TLIBErrGet());
        const int code = tavo::UpdateHosts();
        if (code != 0)
            LogError("%s:%d Set %s error.", tavo::kHostsFile);
        return code == 0 ? 0 : Fail(code);
    });
}
