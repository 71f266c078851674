// Removes or renames the object at a name below /tmp.
#include "account/detail/free_name.h"

#include "core/detail/owner.h"

#include <cstdlib>

#include <limits.h>

namespace tavo {

bool FreeName(const char *path) noexcept
{
    const KeepErrno keep;
    if (::unlink(path) == 0 || errno == ENOENT)
        return true;
    if ((errno != EISDIR && errno != EPERM) || ::rmdir(path) == 0)
        return errno == EISDIR || errno == EPERM;
    char aside[PATH_MAX];
    const int length = std::snprintf(aside, sizeof aside, "%s.aside.XXXXXX", path);
    if (length < 0 || static_cast<size_t>(length) >= sizeof aside || !::mkdtemp(aside))
        return false;
    if (::rename(path, aside) == 0)  // an empty directory gives way to another one
        return true;
    ::rmdir(aside);
    return false;
}

}  // namespace tavo
