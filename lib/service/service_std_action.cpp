// Switches a service by its key, its data folders, its daemons or its script: the standard handler.
#include "tavo_file.h"
#include "tavo_proc.h"
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "service/detail/service_table.h"

namespace {

struct Plan {
    const char *key_value;  // NULL: the key stays
    const char *argument;   // of the script; NULL: nothing is run
    int operation;          // of the daemon; 0: nothing is run
};

constexpr Plan kPlans[] = {
    {"yes", "start", TAVO_DAEMON_START},        // TAVO_SERVICE_ENABLE
    {"no", "stop", TAVO_DAEMON_STOP},           // TAVO_SERVICE_DISABLE
    {nullptr, "stop", TAVO_DAEMON_STOP},        // TAVO_SERVICE_STOP
    {nullptr, "start", TAVO_DAEMON_START},      // TAVO_SERVICE_START
    {nullptr, "restart", TAVO_DAEMON_RESTART},  // TAVO_SERVICE_RESTART
    {"no", nullptr, 0},                         // TAVO_SERVICE_KEY_NO
    {"yes", nullptr, 0},                        // TAVO_SERVICE_KEY_YES
};

constexpr int kActions = sizeof kPlans / sizeof kPlans[0];

bool BindShares(const TAVOSERVICE &service)
{
    for (const int32_t id : tavo::SharesOf(service)) {
        TAVOSERVICESHARE share;
        char volume[52];
        if (TAVOServiceSettingGet(id, &share) < 0 || TAVOServiceNewVolumeDecide(id, volume, sizeof volume) < 1)
            return false;
        if (TAVOServiceSet(id, volume) != 0) {
            LogError("%s:%d Failed to set service %s's share: volume = %s", service.szName, volume);
            return false;
        }
    }
    return true;
}

// The dispatcher drives a service with daemons: its script is run there, or not at all.
int RunService(const TAVOSERVICE &service, const Plan &plan)
{
    if (service.fDaemon) {
        if (plan.operation && TAVONetService(service.fDaemon, plan.operation) < 1) {
            LogError("%s:%d TAVONetService failed with id=%d", service.fDaemon);
            return Fail(ERR_SERVICE_STD_ACTION);
        }
    } else if (service.szScript && plan.argument) {
        if (TLIBExec(service.szScript, plan.argument, nullptr) == -1) {
            LogError("%s:%d TLIBExec failed with script=%s", service.szScript);
            return Fail(ERR_SERVICE_STD_ACTION);
        }
    }
    return 0;
}

}  // namespace

extern "C" int TAVOServiceSTDAction(const TAVOSERVICE *pService, int action)
{
    if (!pService || action < 0 || action >= kActions)
        return Fail(ERR_BAD_PARAMETERS);
    const Plan &plan = kPlans[action];

    if (action == TAVO_SERVICE_ENABLE && !BindShares(*pService))
        return -1;
    if (pService->szKey && plan.key_value && TAVOINFOSetKeyValue(pService->szKey, plan.key_value) < 0) {
        LogError("%s:%d TAVOINFOSetKeyValue failed with key=%s", pService->szKey);
        return -1;
    }
    if (RunService(*pService, plan) != 0)
        return -1;
    if (action == TAVO_SERVICE_DISABLE && !tavo::SharesOf(*pService).empty() &&
        TAVOServiceRemovebyInfo(pService, 0) != 0) {
        LogError("%s:%d Failed to remove share of service %s", pService->szName);
        return -1;
    }
    return 0;
}
