// Checks whether the printer spooler has its folder and runs. The row has no key and no pid file: the spooler starts
// with the first printer.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "service/detail/process_named.h"
#include "service/detail/service_table.h"

extern "C" int TAVOServicePrinterStatus(const TAVOSERVICE *pService)
{
    if (!pService || !pService->szName)
        return FailZero(ERR_BAD_PARAMETERS);
    return TAVOServiceSTDStatus(pService) == 1 && Guard([] { return tavo::IsProcessNamed("lpd"); });
}
