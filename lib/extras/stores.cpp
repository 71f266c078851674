// The database of the account stores.
#include "extras/parts.h"

#include <cerrno>

#include <db_185.h>

namespace tavo::extras {

void *OpenBtree(const char *path, int flags, int mode, bool parameters) noexcept
{
    DatabaseCall call;
    if (!call.Reserve()) {
        errno = ENOMEM;
        return nullptr;
    }
    BTREEINFO none = {};
    DB *store = ::dbopen(path, flags, mode, DB_BTREE, parameters ? &none : nullptr);
    const int error = call.CloseError();
    if (store && error != 0) {
        store->close(store);
        store = nullptr;
        errno = error;
    }
    if (!store)
        call.CloseLeft();
    return store;
}

int CloseBtree(void *store) noexcept
{
    const DatabaseCall call;
    DB *db = static_cast<DB *>(store);
    const int result = db->close(db);
    if (result != 0 || call.CloseError() == 0)
        return result;
    errno = call.CloseError();
    return -1;
}

}  // namespace tavo::extras
