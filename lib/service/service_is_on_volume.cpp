// Checks whether a service's link leads to a volume.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/volume_list.h"

extern "C" int TAVOServiceIsOnVolume(int idShare, const char *szVolume)
{
    TAVOSERVICESHARE share;

    if (!szVolume || !tavo::VolumeNumber(szVolume))
        return Fail(ERR_BAD_PARAMETERS);
    if (TAVOServiceSettingGet(idShare, &share) < 0)
        return -1;
    // The folder itself may be missing while its volume is away; the link still names the volume.
    return tavo::VolumeOf(share.szVolume) == szVolume;
}
