// Records another volume for the share of a service; the data is not moved.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "service/detail/data_folder.h"
#include "service/detail/share_file.h"

#include <climits>
#include <string>

extern "C" int TAVOServiceShareUpdate(int idShare, const char *szVolume)
{
    char path[PATH_MAX];
    TAVOSERVICESHARE share;

    if (TAVOServiceShareGen(idShare, szVolume, path, sizeof path) < 0)
        return -1;
    tavo::FindDataFolder(idShare, share);
    return Guard([&] {
        tavo::Result<std::string> recorded = tavo::SharePath(share.szShareName);
        if (!recorded)
            return Fail(recorded.Failure());
        if (recorded->empty())
            return Fail(ERR_NO_SUCH_SHARE);
        if (const tavo::Code code = tavo::RecordShare(share.szShareName, path))
            return Fail(code);
        return 0;
    });
}
