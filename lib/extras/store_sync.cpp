// Whom the database calls in place of fsync. It has two interfaces whose headers cannot be included together.
#include "extras/parts.h"

#include <db.h>

namespace tavo::extras {

void SyncBy(int (*sync)(int fd)) noexcept
{
    ::db_env_set_func_fsync(sync);
}

}  // namespace tavo::extras
