// Tells whether a service's link leads to a volume.
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
    // The folder itself may be away with its volume; the link says where it belongs.
    return tavo::VolumeOf(share.szVolume) == szVolume;
}
