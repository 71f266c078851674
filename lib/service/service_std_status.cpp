// Checks whether a service is enabled, has its data folders and runs: the standard handler.
#include "tavo_lock.h"
#include "tavo_proc.h"
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "core/detail/process_list.h"
#include "core/detail/setting_switch.h"
#include "service/detail/process_named.h"
#include "service/detail/service_table.h"

#include <cstring>

namespace {

constexpr unsigned kSettingsLock = TAVO_LOCK_TAVOINFO;
constexpr int kLockSeconds = 5;

enum class Enabled { no, yes, unknown };

// Only "no" switches a service off: a service whose key was never written is on.
Enabled IsEnabled(const char *key)
{
    if (!key)
        return Enabled::yes;
    if (ErrTLIBFileLock(kSettingsLock | TAVO_LOCK_SHARED | TAVO_LOCK_NONBLOCKING, kLockSeconds) != 0)
        return Enabled::unknown;
    const bool no = tavo::SettingEquals(tavo::kSettings, key, "no");
    if (ErrTLIBFileUnlock(kSettingsLock) != 0)
        return Enabled::unknown;
    return no ? Enabled::no : Enabled::yes;
}

bool IsRunning(const char *proc)
{
    if (!proc)
        return true;
    if (!std::strchr(proc, '/'))
        return tavo::IsProcessNamed(proc);
    // A zombie still accepts signals until its parent asks for its status.
    return TLIBProcAliveByPidFile(proc) && !tavo::IsZombie(TLIBReadPidFile(proc));
}

bool IsOn(const TAVOSERVICE &service)
{
    const auto shares = tavo::SharesOf(service);
    if (!service.szKey && !service.szProc && shares.empty())
        return false;
    const Enabled enabled = IsEnabled(service.szKey);
    if (enabled == Enabled::unknown)
        return false;
    bool bound = true;
    for (const int32_t id : shares) {
        TAVOSERVICESHARE share;
        bound = TAVOServiceSettingGet(id, &share) != 0 && bound;
    }
    return bound && enabled == Enabled::yes && IsRunning(service.szProc);
}

}  // namespace

extern "C" int TAVOServiceSTDStatus(const TAVOSERVICE *pService)
{
    if (!pService || !pService->szName)
        return FailZero(ERR_BAD_PARAMETERS);
    return Guard([&] { return IsOn(*pService); });
}
