// The file of a store: whether it is one at all, and how a new one comes to be.
#ifndef TAVO_ACCOUNT_DETAIL_BTREE_FILE_H
#define TAVO_ACCOUNT_DETAIL_BTREE_FILE_H

#include <sys/types.h>

namespace tavo {

enum class BtreeFile { missing, store, foreign, unreadable };

// Looks at the first page, because the database prints to standard error when it meets a file that is not its own, and
// follows page numbers that a truncated file does not have. A link, a FIFO or a directory is foreign. `unreadable`
// leaves the reason in errno. When it is a store and `mode` is not 0, root gives it that mode.
BtreeFile LookAtBtreeFile(const char *path, mode_t mode) noexcept;

// Puts an empty store at `path`, where nothing may be. It is made in a directory of our own beside it: the database
// itself would build it as "__db.NAME" there and wait for ever for one that a killed process left.
// False with errno on failure.
bool CreateBtreeFile(const char *path, bool info, mode_t mode);

}  // namespace tavo

#endif
