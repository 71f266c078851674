// Checks whether a service is enabled and running.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"

extern "C" int TAVOServiceStatusGet(int id)
{
    const TAVOSERVICE *service = tavo::FindService(id);
    if (!service || !service->pfStatus)
        return FailZero(ERR_BAD_PARAMETERS);
    return service->pfStatus(service);
}
