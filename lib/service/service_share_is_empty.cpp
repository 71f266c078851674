// Tells whether the data folder of a service holds anything.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"

#include <memory>
#include <string_view>

#include <dirent.h>

namespace {

struct CloseFolder {
    void operator()(DIR *folder) const { ::closedir(folder); }
};

}  // namespace

extern "C" int TAVOServiceShareIsEmpty(int idShare)
{
    const tavo::ServiceShareRow *row = tavo::FindServiceShare(idShare);
    if (!row)
        return Fail(ERR_BAD_PARAMETERS);
    const std::unique_ptr<DIR, CloseFolder> folder(::opendir(row->share.szLink));
    if (!folder)
        return Fail(ERR_MAKE_PATH);
    while (const dirent *entry = ::readdir(folder.get())) {
        const std::string_view name = entry->d_name;
        if (name != "." && name != "..")
            return 0;
    }
    return 1;
}
