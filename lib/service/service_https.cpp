// Switches encrypted access to the web pages. The system web server itself serves it and reads the key at its start.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"

extern "C" int TAVOServiceHTTPS(const TAVOSERVICE *pService, int action)
{
    if (TAVOServiceSTDAction(pService, action) != 0)
        return -1;
    if (action >= TAVO_SERVICE_KEY_NO)
        return 0;
    if (TAVONetService(TAVO_DAEMON_WEB_SYSTEM, TAVO_DAEMON_RESTART) < 1) {
        LogError("%s:%d Failed to restart the system web server");
        return Fail(ERR_SERVICE_STD_ACTION);
    }
    return 0;
}
