// Where the home folders of users are.
#ifndef TAVO_ACCOUNT_DETAIL_HOME_FOLDERS_H
#define TAVO_ACCOUNT_DETAIL_HOME_FOLDERS_H

#include "core/detail/open_file.h"

#include <string>

namespace tavo {

// A folder's name, never a path: accounts of other systems may be called anything.
bool IsFolderName(const std::string &name);

// Empty with errno when it cannot be opened. The caller owns the descriptor.
Fd OpenFolder(const char *path);

// The inode number of a folder in `folder`; 0 with errno when it does not exist, is not a plain name, or cannot be read.
uint64_t InodeOf(const Fd &folder, const std::string &name);

// Where the share "homes" is; empty, when there is none. errno is ENOENT then, unless the settings cannot be read.
std::string PathOfHomes();

}  // namespace tavo

#endif
