// The file of a store: whether it is one at all, and how a new one comes to be.
#ifndef TAVO_ACCOUNT_DETAIL_BTREE_FILE_H
#define TAVO_ACCOUNT_DETAIL_BTREE_FILE_H

#include <sys/types.h>

namespace tavo {

enum class BtreeFile { missing, store, foreign, unreadable };

// How the file of a store has to be.
struct StoreAccess {
    mode_t mode = 0;       // the mode to set; 0 leaves it unchanged
    bool is_ours = false;  // it must belong to root, with one name and no right beyond `mode`: else it is foreign
};

// The state of the file before the open, by which the opened file is recognised.
struct StoreFile {
    dev_t device = 0;
    ino_t inode = 0;
};

// Looks at the first page, because the database prints to standard error when it meets a file that is not its own, and
// follows page numbers that a truncated file does not have. A link, a FIFO or a directory is foreign. `unreadable`
// leaves the reason in errno. When it is a store, root gives it its mode.
BtreeFile LookAtBtreeFile(const char *path, const StoreAccess &access, StoreFile &file) noexcept;

// Puts an empty store at `path`, where nothing may be. It is made in a directory of our own beside it: the database
// itself would build it as "__db.NAME" there and wait for ever for one that a killed process left.
// False with errno on failure.
bool CreateBtreeFile(const char *path, bool info, mode_t mode);

}  // namespace tavo

#endif
