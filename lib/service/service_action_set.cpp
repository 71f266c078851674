// Switches a service: the one entry point that programs use.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "service/detail/service_table.h"

namespace {

// The daemon operation of an action; 0 when the action is meaningless for a daemon without a key.
int OperationOf(int action)
{
    switch (action) {
    case TAVO_SERVICE_ENABLE:
    case TAVO_SERVICE_START:
        return TAVO_DAEMON_START;
    case TAVO_SERVICE_DISABLE:
    case TAVO_SERVICE_STOP:
        return TAVO_DAEMON_STOP;
    case TAVO_SERVICE_RESTART:
        return TAVO_DAEMON_RESTART;
    default:
        return 0;
    }
}

}  // namespace

extern "C" int TAVOServiceActionSet(int id, int action)
{
    const TAVOSERVICE *service = tavo::FindService(id);
    if (!service)
        return Fail(ERR_BAD_PARAMETERS);

    if (service->pfAction) {
        const int result = service->pfAction(service, action);
        if (result != 0)
            LogDebug("%s:%d Service %s act failed", service->szName);
        return result;
    }
    if (service->szKey) {
        LogError("%s:%d Unmanaged Service %s found! SHOULD have an action interface", service->szName);
        return Fail(ERR_SERVICE_ACTION);
    }
    if (!service->fDaemon) {
        LogError("%s:%d Weird Service %s found! no runkey & scripts", service->szName);
        return Fail(ERR_SERVICE_ACTION);
    }
    const int operation = OperationOf(action);
    if (operation == 0) {
        LogError("%s:%d Illegal action with Daemon %s", service->szName);
        return Fail(ERR_BAD_PARAMETERS);
    }
    if (TAVONetService(service->fDaemon, operation) > 0)
        return 0;
    LogDebug("%s:%d Action of Daemon %s Failed", service->szName);
    return Fail(ERR_SERVICE_STD_ACTION);
}
