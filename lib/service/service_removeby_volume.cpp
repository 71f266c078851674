// Releases the data folders on a volume, before it is taken out of use.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"
#include "service/detail/volume_list.h"

extern "C" int TAVOServiceRemovebyVolume(const char *szVolume, int fDelete)
{
    if (!szVolume || !tavo::VolumeNumber(szVolume))
        return Fail(ERR_BAD_PARAMETERS);
    bool done = true;
    for (int share = 1; share < tavo::kServiceShares; ++share) {
        if (TAVOServiceIsOnVolume(share, szVolume) == 1)
            done = TAVOServiceRemove(share, fDelete) == 0 && done;
    }
    if (!done)
        return Fail(ERR_SERVICE_REMOVE);
    return 0;
}
