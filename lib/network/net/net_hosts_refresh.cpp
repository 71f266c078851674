// Finishes a change that was cut off, and brings /etc/hosts up to date: for the start of the network and the hook of
// the DHCP client.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/network_change.h"

extern "C" int TAVONetHostsRefresh(void)
{
    return Guard([] {
        // Never waits: the holder of the lock may be waiting for the client whose hook calls this.
        const tavo::LockHold lock(tavo::kNetworkExclusive, 0);
        if (!lock)
            return TLIBErrGet() == ERR_LOCK_FAILED ? 1 : Fail(TLIBErrGet());
        const int code = tavo::FinishAndKeepHostsTrue();
        return code == 0 ? 0 : Fail(code);
    });
}
