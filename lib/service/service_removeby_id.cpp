// Releases the data folders of a service by its id.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"

extern "C" int TAVOServiceRemovebyID(int id, int fDelete)
{
    const TAVOSERVICE *service = tavo::FindService(id);
    if (!service)
        return Fail(ERR_BAD_PARAMETERS);
    return TAVOServiceRemovebyInfo(service, fDelete);
}
