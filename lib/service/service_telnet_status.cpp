// Checks whether Telnet is enabled and inetd, which answers for it, runs.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "service/detail/process_named.h"

extern "C" int TAVOServiceTelnetStatus(const TAVOSERVICE *pService)
{
    return TAVOServiceSTDStatus(pService) == 1 && Guard([] { return tavo::IsProcessNamed("inetd"); });
}
