// One change of the network: under its lock from beginning to end, with /etc/hosts true of the result.
//
//     return Guard([&] {
//         return tavo::ChangeNetwork([&] { ... return 0; });
//     });
#ifndef TAVO_NETWORK_DETAIL_NETWORK_CHANGE_H
#define TAVO_NETWORK_DETAIL_NETWORK_CHANGE_H

#include "core/detail/fault.h"
#include "core/detail/function_ref.h"
#include "core/detail/lock_hold.h"
#include "network/detail/hosts_file.h"
#include "network/detail/network_lock.h"

namespace tavo {

// Called by a function that has held the lock: rewrites /etc/hosts if the hook of a DHCP client could not, because the
// lock was held. A failure is logged.
void KeepHostsTrueAfterwards(Where where = Where());

// Called under the lock without a change of its own: completes the change of a process that died, and rewrites
// /etc/hosts if it is out of date. Returns 0 or the code of the latter.
int FinishAndKeepHostsTrue(Where where = Where());

// Runs the body, which gives the result of the exported function, under the lock: with `more_locks` in one request.
// -1 with ERR_LOCK_FAILED when the lock is not free in time.
int ChangeNetwork(FunctionRef<int()> body, unsigned more_locks = 0, Where where = Where());

}  // namespace tavo

#endif
