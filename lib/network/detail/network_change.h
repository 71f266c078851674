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

// For somebody who has held the lock: rewrites /etc/hosts where the hook of a DHCP client could not, because the lock was
// held. That it cannot be written is logged.
void KeepHostsTrueAfterwards(Where where = Where());

// For somebody who holds the lock and changes nothing himself: finishes what a process that died has left, and rewrites
// /etc/hosts where it is not true. 0 or the code of the latter.
int FinishAndKeepHostsTrue(Where where = Where());

// Runs the body, which gives the result of the exported function, under the lock: with `more_locks` in one request.
// -1 with ERR_LOCK_FAILED when the lock cannot be had.
int ChangeNetwork(FunctionRef<int()> body, unsigned more_locks = 0, Where where = Where());

}  // namespace tavo

#endif
