// Composes the path of a service's data folder on a volume.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/data_folder.h"
#include "service/detail/volume_list.h"

#include <cstdio>

extern "C" int TAVOServiceShareGen(int idShare, const char *szVolume, char *szPath, int cbPath)
{
    TAVOSERVICESHARE share;

    if (!szVolume || !tavo::VolumeNumber(szVolume) || !szPath || cbPath <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    if (!tavo::FindDataFolder(idShare, share))
        return -1;
    const int length = std::snprintf(nullptr, 0, "%s/%s", szVolume, share.szShareName);
    if (length >= cbPath)
        return Fail(ERR_NOT_ENOUGH_MEMORY);
    std::snprintf(szPath, static_cast<size_t>(cbPath), "%s/%s", szVolume, share.szShareName);
    return length + 1;
}
