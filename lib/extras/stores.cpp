// The database of the account stores.
#include "extras/parts.h"

#include <db_185.h>

namespace tavo::extras {

void *OpenBtree(const char *path, int flags, int mode, bool parameters) noexcept
{
    BTREEINFO none = {};
    return ::dbopen(path, flags, mode, DB_BTREE, parameters ? &none : nullptr);
}

}  // namespace tavo::extras
