// Keeps the database from syncing store files to disk.
#include "account/detail/store_sync.h"

#include <unistd.h>

#include <db.h>

namespace tavo {
namespace {

thread_local int depth = 0;

int SyncUnlessStore(int fd)
{
    return depth > 0 ? 0 : ::fdatasync(fd);
}

}  // namespace

NoStoreSync::NoStoreSync() noexcept
{
    if (depth++ == 0)
        ::db_env_set_func_fsync(SyncUnlessStore);
}

NoStoreSync::~NoStoreSync()
{
    if (--depth == 0)
        ::db_env_set_func_fsync(nullptr);
}

}  // namespace tavo
