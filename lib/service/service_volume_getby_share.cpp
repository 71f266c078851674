// Returns the volume that holds a share.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "service/detail/share_file.h"
#include "service/detail/volume_list.h"

#include <cstring>
#include <string>

extern "C" int TAVOServiceVolumeGetbyShare(const char *szShare, char *szVolume, int cbVolume)
{
    if (!szShare || !*szShare || !szVolume || cbVolume <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::Result<std::string> path = tavo::SharePath(szShare);
        if (!path)
            return Fail(path.Failure());
        const std::string_view volume = tavo::VolumeOf(*path);
        if (volume.empty())
            return FailNone(ERR_NO_SUCH_SHARE);
        if (volume.size() >= static_cast<size_t>(cbVolume))
            return Fail(ERR_NOT_ENOUGH_MEMORY);
        std::memcpy(szVolume, volume.data(), volume.size());
        szVolume[volume.size()] = 0;
        return static_cast<int>(volume.size()) + 1;
    });
}
