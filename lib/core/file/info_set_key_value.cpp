// Sets a key of the system settings file under its lock.
#include "tavo_file.h"

#include "core/detail/fault.h"
#include "core/detail/lock_hold.h"

namespace {

constexpr const char *kSettings = "/etc/tavoinfo.conf";
constexpr unsigned kLock = TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING;
constexpr int kLockSeconds = 5;

}  // namespace

extern "C" int TAVOINFOSetKeyValue(const char *szKey, const char *szValue)
{
    if (!szKey || !szValue)
        return Fail(ERR_BAD_PARAMETERS);
    const tavo::LockHold lock(kLock, kLockSeconds);
    return lock ? TLIBFileSetKeyValue(kSettings, szKey, szValue, nullptr) : -1;
}
