// Removes the link of a service's data folder.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"

#include <cerrno>

#include <sys/stat.h>
#include <unistd.h>

extern "C" int TAVOServiceLinkRemove(int idShare)
{
    const tavo::ServiceShareRow *row = tavo::FindServiceShare(idShare);
    struct stat st;

    if (!row)
        return Fail(ERR_BAD_PARAMETERS);
    if (::lstat(row->share.szLink, &st) != 0)
        return errno == ENOENT || errno == ENOTDIR ? 0 : Fail(ERR_REMOVE_FAILED);
    // Anything but a link there may be a user's data.
    if (!S_ISLNK(st.st_mode) || ::unlink(row->share.szLink) != 0)
        return Fail(ERR_REMOVE_FAILED);
    return 0;
}
