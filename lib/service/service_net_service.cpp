// Stops, starts, restarts or reloads a set of daemons, in an order that their dependencies allow.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "core/detail/lock_hold.h"
#include "core/detail/log.h"
#include "service/detail/daemon_order.h"

namespace {

// The locks of the settings file, of Samba and of the Apple files, exclusively, because start scripts write these
// files. So a start script must not call a function that takes one of these locks: it would wait for its time-out and
// fail.
constexpr unsigned kServiceLock =
    TAVO_LOCK_TAVOINFO | TAVO_LOCK_SMB | TAVO_LOCK_APPLE | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING;
constexpr int kLockSeconds = 5;

}  // namespace

extern "C" int TAVONetService(uint32_t fDaemon, int operation)
{
    if (fDaemon == 0 || operation < TAVO_DAEMON_STOP || operation > TAVO_DAEMON_RELOAD) {
        LogError("%s(%d):  bad parameter");
        return Fail(ERR_BAD_PARAMETERS);
    }
    const tavo::LockHold lock(kServiceLock, kLockSeconds);
    if (!lock) {
        LogError("%s(%d): lock failed");
        return -1;  // the lock's own code is kept
    }
    return Guard([&] { return tavo::DriveInOrder(fDaemon, operation); });
}
