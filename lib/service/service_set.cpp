// Binds a service's data folder to a volume: the share, then the link.
#include "tavo_service.h"

#include <climits>

extern "C" int TAVOServiceSet(int idShare, const char *szVolume)
{
    char path[PATH_MAX];

    if (TAVOServiceShareGen(idShare, szVolume, path, sizeof path) < 0 || TAVOServiceShareCreate(idShare, szVolume) != 0)
        return -1;  // their codes stand
    return TAVOServiceLinkSet(idShare, path);
}
