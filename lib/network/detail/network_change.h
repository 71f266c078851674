// One change of the network: under its lock from beginning to end, with /etc/hosts true of the result.
//
//     return Guard([&] {
//         return tavo::ChangeNetwork([&] { ... return 0; });
//     });
#ifndef TAVO_NETWORK_DETAIL_NETWORK_CHANGE_H
#define TAVO_NETWORK_DETAIL_NETWORK_CHANGE_H

#include "core/detail/fault.h"
#include "core/detail/keep_fault.h"
#include "core/detail/lock_hold.h"
#include "core/detail/log.h"
#include "network/detail/hosts_file.h"
#include "network/detail/network_lock.h"

#include <unistd.h>

namespace tavo {
namespace {

// Writes /etc/hosts where it is not true any more. That it cannot be written changes nothing of the result.
[[maybe_unused]] inline void KeepHostsTrue(Line line = Line{__builtin_LINE()})
{
    if (UpdateHosts() != 0)
        LogError({"%s:%d Set %s error.", line.number}, kHostsFile);
}

// The same for somebody who could not do it because the lock was held: whoever held it looks after its release.
[[maybe_unused]] inline void KeepHostsTrueAfterwards()
{
    if (::geteuid() != 0 || AreHostsTrue())
        return;
    const KeepFault keep;
    const LockHold lock(kNetworkExclusive, 0);
    if (lock)
        KeepHostsTrue();
}

// Runs the body, which gives the result of the exported function, under the lock: with `more_locks` in one request.
// -1 with ERR_LOCK_FAILED when the lock cannot be had.
template <class Body>
int ChangeNetwork(Body &&body, unsigned more_locks = 0, Line line = Line{__builtin_LINE()})
{
    int result = -1;
    {
        const LockHold lock(kNetworkExclusive | more_locks, kNetworkSeconds);
        if (!lock)
            return Fail(ERR_LOCK_FAILED, line);
        result = body();
        KeepHostsTrue(line);
    }
    KeepHostsTrueAfterwards();
    return result;
}

}  // namespace
}  // namespace tavo

#endif
