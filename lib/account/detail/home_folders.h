// Where the home folders of users are.
#ifndef TAVO_ACCOUNT_DETAIL_HOME_FOLDERS_H
#define TAVO_ACCOUNT_DETAIL_HOME_FOLDERS_H

#include "core/detail/open_file.h"

#include <string>

namespace tavo {

// A folder's name, never a path: accounts of other systems may be called anything.
bool IsFolderName(const std::string &name);

Fd OpenFolder(const char *path);

// 0 with errno when there is no such folder.
uint64_t InodeOf(const Fd &folder, const std::string &name);

// Where the share "homes" is; empty, when there is none. errno is ENOENT then, unless the settings cannot be read.
std::string PathOfHomes();

}  // namespace tavo

#endif
