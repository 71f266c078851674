// Creates a service's data folder on a volume and records it as a share.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "service/detail/data_folder.h"
#include "service/detail/share_file.h"

#include <cerrno>
#include <climits>
#include <string>

namespace {

// Creates the missing folders of `path` below its volume.
bool MakeFolders(const std::string &path)
{
    for (size_t slash = path.find('/', 1); slash != std::string::npos;) {
        slash = path.find('/', slash + 1);
        const std::string folder = path.substr(0, slash);
        if (::mkdir(folder.c_str(), 0755) != 0 && !(errno == EEXIST && tavo::IsRealFolder(folder.c_str())))
            return false;
    }
    return true;
}

}  // namespace

extern "C" int TAVOServiceShareCreate(int idShare, const char *szVolume)
{
    char path[PATH_MAX];
    TAVOSERVICESHARE share;

    if (TAVOServiceShareGen(idShare, szVolume, path, sizeof path) < 0)
        return -1;
    return Guard([&] {
        if (!MakeFolders(path))
            return Fail(errno == ENOSPC ? ERR_NOT_ENOUGH_SPACE : ERR_MKDIR_FAILED);
        tavo::FindDataFolder(idShare, share);
        if (const tavo::Code code = tavo::RecordShare(share.szShareName, path))
            return Fail(code);
        return 0;
    });
}
