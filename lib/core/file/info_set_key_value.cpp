// Sets a key of the system settings file under its lock.
#include "tavo_file.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/fault.h"
#include "core/detail/lock_hold.h"

namespace {

constexpr unsigned kLock = TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING;
constexpr int kLockSeconds = 5;

}  // namespace

extern "C" int TAVOINFOSetKeyValue(const char *szKey, const char *szValue)
{
    if (!szKey || !szValue)
        return Fail(ERR_BAD_PARAMETERS);
    const tavo::LockHold lock(kLock, kLockSeconds);
    return lock ? TLIBFileSetKeyValue(tavo::kSettings, szKey, szValue, nullptr) : -1;
}
