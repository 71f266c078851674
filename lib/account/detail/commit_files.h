// The files of a commit, one by one: made beside the file that each replaces, and moved over it.
#ifndef TAVO_ACCOUNT_DETAIL_COMMIT_FILES_H
#define TAVO_ACCOUNT_DETAIL_COMMIT_FILES_H

#include "account/detail/commit_marker.h"
#include "core/detail/owner.h"

#include <vector>

namespace tavo {

// Creates a temporary file of mode 0600 in place of whatever has its name. With `makes_folder` also the folder that a fresh
// appliance may still lack (Samba's private one). Empty with errno on failure.
Fd CreateTemporary(const char *path, bool makes_folder);

// True while the temporary file is the one that was completed.
bool IsWhole(const FileStep &file);

bool MoveIntoPlace(const FileStep &file) noexcept;

// Makes the moves durable. Without memory: between the marker and the last move nothing else may go wrong.
bool SyncFolders(const std::vector<FileStep> &files) noexcept;

}  // namespace tavo

#endif
