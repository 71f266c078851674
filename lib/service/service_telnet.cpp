// Switches Telnet. inetd serves other protocols as well, so it is restarted, never stopped: it reads the key again.
#include "tavo_file.h"
#include "tavo_proc.h"
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"

namespace {

// The key after an action; NULL: unchanged.
const char *KeyAfter(int action)
{
    switch (action) {
    case TAVO_SERVICE_ENABLE:
    case TAVO_SERVICE_KEY_YES:
        return "yes";
    case TAVO_SERVICE_DISABLE:
    case TAVO_SERVICE_KEY_NO:
        return "no";
    default:
        return nullptr;
    }
}

}  // namespace

extern "C" int TAVOServiceTelnet(const TAVOSERVICE *pService, int action)
{
    if (!pService || action < TAVO_SERVICE_ENABLE || action > TAVO_SERVICE_KEY_YES)
        return Fail(ERR_BAD_PARAMETERS);
    if (const char *value = KeyAfter(action); value && TAVOINFOSetKeyValue(pService->szKey, value) < 0) {
        LogError("%s:%d TAVOINFOSetKeyValue failed with key=%s", pService->szKey);
        return -1;
    }
    if (action >= TAVO_SERVICE_KEY_NO)
        return 0;
    if (TLIBExec(pService->szScript, "restart", nullptr) == -1) {
        LogError("%s:%d TLIBExec failed with script=%s", pService->szScript);
        return Fail(ERR_SERVICE_STD_ACTION);
    }
    return 0;
}
