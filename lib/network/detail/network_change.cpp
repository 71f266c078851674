// One change of the network.
#include "network/detail/network_change.h"

#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "network/detail/checkpoint.h"
#include "network/detail/network_checkpoint.h"

#include <unistd.h>

namespace tavo {
namespace {

void KeepHostsTrue(const Where &where)
{
    if (UpdateHosts() != 0)
        LogErrorAt(where, "%s:%d Set %s error.", kHostsFile);
}

// Not a function that is a part of another one's change.
bool IsOutermost()
{
    for (const TLIBLOCKFILE *entry = rgslckList; entry->fLockBit != 0; ++entry) {
        if (entry->fLockBit == TAVO_LOCK_HOST)
            return entry->nRef == 1;
    }
    return false;
}

void FinishWhatWasLeft(Where where)
{
    FinishCutOffChange(where);
    PutBackAbandonedCheckpoint(where);
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

int FinishAndKeepHostsTrue(Where where)
{
    if (IsOutermost())
        FinishWhatWasLeft(where);
    const int code = UpdateHosts();
    if (code != 0)
        LogErrorAt(where, "%s:%d Set %s error.", kHostsFile);
    return code;
}

int ChangeNetwork(FunctionRef<int()> body, unsigned more_locks, Where where)
{
    int result = -1;
    {
        const LockHold lock(kNetworkExclusive | more_locks, kNetworkSeconds);
        if (!lock)
            return Fail(ERR_LOCK_FAILED, where);
        if (IsOutermost())
            FinishWhatWasLeft(where);
        result = body();
        KeepHostsTrue(where);
    }
    KeepHostsTrueAfterwards(where);
    return result;
}

}  // namespace tavo
