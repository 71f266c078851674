// Releases the data folder of a service: the link, then the share.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"

extern "C" int TAVOServiceRemove(int idShare, int fDelete)
{
    if (!tavo::FindServiceShare(idShare))
        return Fail(ERR_BAD_PARAMETERS);
    const bool unlinked = TAVOServiceLinkRemove(idShare) == 0;
    const bool forgotten = TAVOServiceShareRemove(idShare, fDelete) == 0;
    if (!unlinked || !forgotten)
        return Fail(ERR_SERVICE_REMOVE);
    return 0;
}
