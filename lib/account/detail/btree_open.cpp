// Opens and creates stores.
#include "account/detail/btree.h"
#include "account/detail/btree_file.h"
#include "account/detail/free_name.h"
#include "account/detail/store_seal.h"
#include "account/detail/store_sync.h"
#include "core/detail/extras.h"

#include <cerrno>

#include <db_185.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace tavo {
namespace {

Code OpenCode(int reason)
{
    switch (reason) {
    case ENOMEM:
        return ERR_OUT_OF_MEMORY;
    case EACCES:
    case EPERM:
        return ERR_ACCESS_DENIED;
    case ENOENT:
        return ERR_FILE_NOT_FOUND;
    case EINVAL:
        return ERR_DB_OPEN;
    case ENOSPC:
    case EDQUOT:
        return ERR_NOT_ENOUGH_SPACE;
    default:
        return ERR_OPEN_FAILED;
    }
}

// Removes a file that is not a store so that the next open can create one. Only root clears the names of the families.
Code RemoveForeign(const char *path, bool is_ours)
{
    if (is_ours && ::geteuid() != 0)
        return ERR_ACCESS_DENIED;
    if (is_ours)
        FreeName(path);
    else
        ::unlink(path);
    errno = EINVAL;
    return ERR_DB_OPEN;
}

// Returns whether the database has opened the very file that was looked at.
bool IsSameFile(const Btree &store, const StoreFile &file)
{
    const DB *db = static_cast<const DB *>(store.pDb);
    struct stat st;
    return ::fstat(db->fd(db), &st) == 0 && st.st_dev == file.device && st.st_ino == file.inode;
}

}  // namespace

Code Btree::Open(const char *path, const Options &options, std::unique_ptr<Btree> &out)
{
    const Extras *extras = LoadExtras();
    if (!extras)
        return ERR_OPEN_FAILED;
    const bool may_create = (options.flags & O_CREAT) != 0;
    const mode_t mode_of_ours = ModeOfStore(path);
    const StoreAccess access{mode_of_ours != 0 ? mode_of_ours : options.mode, mode_of_ours != 0};
    if (access.is_ours && may_create && ::geteuid() != 0)
        return ERR_ACCESS_DENIED;
    struct stat st;
    if (may_create && ::lstat(path, &st) == 0 && S_ISREG(st.st_mode) &&
        (st.st_size == 0 || (options.flags & O_TRUNC) != 0))
        ::unlink(path);  // an empty file is as good as none to a caller who would create one
    StoreFile file;
    BtreeFile found = LookAtBtreeFile(path, access, file);
    if (found == BtreeFile::missing && may_create) {
        if (!CreateBtreeFile(path, options.info, access.mode))
            return OpenCode(errno);
        found = LookAtBtreeFile(path, access, file);
    }
    switch (found) {
    case BtreeFile::foreign:
        return RemoveForeign(path, access.is_ours);
    case BtreeFile::unreadable:
        return OpenCode(errno);
    case BtreeFile::missing:
        return ERR_FILE_NOT_FOUND;
    case BtreeFile::store:
        break;
    }
    std::unique_ptr<Btree> store(new Btree(path, (options.flags & O_ACCMODE) == O_RDONLY));
    errno = 0;
    store->pDb = extras->open_btree(path, options.flags & O_ACCMODE, 0, options.info);
    if (!store->pDb)
        return errno == EINVAL ? RemoveForeign(path, access.is_ours) : OpenCode(errno);
    if (!IsSameFile(*store, file))
        return ERR_OPEN_FAILED;
    out = std::move(store);
    return 0;
}

Code Btree::Create(const char *path, std::unique_ptr<Btree> &out)
{
    const Extras *extras = LoadExtras();
    if (!extras)
        return ERR_OPEN_FAILED;
    const NoStoreSync no_sync;
    std::unique_ptr<Btree> store(new Btree(path, false));
    errno = 0;
    store->pDb = extras->open_btree(path, O_RDWR | O_CREAT, 0600, true);
    if (!store->pDb)
        return OpenCode(errno);
    out = std::move(store);
    return 0;
}

}  // namespace tavo
