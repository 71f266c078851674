// Chooses the volume for a service's data.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "service/detail/service_table.h"
#include "service/detail/volume_list.h"

#include <algorithm>
#include <cstdio>
#include <vector>

#include <sys/statvfs.h>

namespace {

unsigned long long FreeBytes(const tavo::Volume &volume)
{
    struct statvfs space;
    if (!volume.writable || ::statvfs(volume.path.c_str(), &space) != 0)
        return 0;
    return static_cast<unsigned long long>(space.f_bavail) * space.f_frsize;
}

// Returns the mounted volume that holds the service's data; 0 when its folder is gone, -1 when its link cannot be read.
// A folder at the path of an unmounted volume is on the system's own disk and does not count.
int OldVolume(int idShare, const std::vector<tavo::Volume> &mounted)
{
    TAVOSERVICESHARE share;
    const int found = TAVOServiceSettingGet(idShare, &share);
    if (found != 1)
        return found;
    const int number = tavo::VolumeNumber(tavo::VolumeOf(share.szVolume));
    return std::any_of(mounted.begin(), mounted.end(),
                       [&](const tavo::Volume &volume) { return volume.number == number; })
               ? number
               : 0;
}

int RoomiestVolume(const std::vector<tavo::Volume> &mounted)
{
    int best = 0;
    unsigned long long most = 0;
    for (const tavo::Volume &volume : mounted) {
        const unsigned long long space = FreeBytes(volume);
        if (space > most) {
            most = space;
            best = volume.number;
        }
    }
    return best;
}

}  // namespace

extern "C" int TAVOServiceNewVolumeDecide(int idShare, char *szVolume, int cbVolume)
{
    if (!tavo::FindServiceShare(idShare) || !szVolume || cbVolume <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::vector<tavo::Volume> mounted = tavo::MountedVolumes();
        int number = OldVolume(idShare, mounted);
        if (number < 0)
            return -1;  // another volume would be chosen although the data exists
        if (number == 0)
            number = RoomiestVolume(mounted);
        if (number == 0)
            return FailNone(ERR_NO_SERVICE_VOLUME);
        const std::string path = "/volume" + std::to_string(number);
        if (path.size() >= static_cast<size_t>(cbVolume))
            return Fail(ERR_BAD_PARAMETERS);
        std::snprintf(szVolume, static_cast<size_t>(cbVolume), "%s", path.c_str());
        return number;
    });
}
