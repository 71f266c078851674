// One change of the network.
#include "network/detail/network_change.h"

#include "core/detail/keep_fault.h"
#include "core/detail/log.h"

#include <unistd.h>

namespace tavo {
namespace {

void KeepHostsTrue(const Where &where)
{
    if (UpdateHosts() != 0)
        LogErrorAt(where, "%s:%d Set %s error.", kHostsFile);
}

}  // namespace

void KeepHostsTrueAfterwards(Where where)
{
    if (::geteuid() != 0 || AreHostsTrue())
        return;
    const KeepFault keep;
    const LockHold lock(kNetworkExclusive, 0);
    if (lock)
        KeepHostsTrue(where);
}

int ChangeNetwork(FunctionRef<int()> body, unsigned more_locks, Where where)
{
    int result = -1;
    {
        const LockHold lock(kNetworkExclusive | more_locks, kNetworkSeconds);
        if (!lock)
            return Fail(ERR_LOCK_FAILED, where);
        result = body();
        KeepHostsTrue(where);
    }
    KeepHostsTrueAfterwards(where);
    return result;
}

}  // namespace tavo
