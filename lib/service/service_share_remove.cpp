// Removes the record of a service's share and, on request, deletes its folder.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "service/detail/data_folder.h"
#include "service/detail/service_table.h"
#include "service/detail/share_file.h"
#include "service/detail/volume_list.h"

#include <filesystem>
#include <string>

namespace {

// A user who may write to the volume must not choose what root deletes.
bool HasNoLinks(const std::string &path)
{
    for (size_t slash = path.find('/', 1); slash != std::string::npos; slash = path.find('/', slash + 1)) {
        if (!tavo::IsRealFolder(path.substr(0, slash).c_str()))
            return false;
    }
    return true;
}

}  // namespace

extern "C" int TAVOServiceShareRemove(int idShare, int fDelete)
{
    TAVOSERVICESHARE share;

    if (!tavo::FindServiceShare(idShare))
        return Fail(ERR_BAD_PARAMETERS);
    tavo::FindDataFolder(idShare, share);
    return Guard([&] {
        tavo::Result<std::string> path = tavo::SharePath(share.szShareName);
        if (!path)
            return Fail(path.Failure());
        // The library never records a path outside the volumes, so it deletes nothing for such a record.
        if (fDelete && !tavo::VolumeOf(*path).empty() && path->find("/../") == std::string::npos &&
            path->ends_with(share.szShareName) && HasNoLinks(*path)) {
            std::error_code failed;
            std::filesystem::remove_all(*path, failed);  // deletes links, never follows them
            if (failed)
                return Fail(ERR_REMOVE_FAILED);
        }
        if (const tavo::Code code = tavo::ForgetShare(share.szShareName))
            return Fail(code);
        return 0;
    });
}
