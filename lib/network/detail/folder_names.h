// The names in a folder.
#ifndef TAVO_NETWORK_DETAIL_FOLDER_NAMES_H
#define TAVO_NETWORK_DETAIL_FOLDER_NAMES_H

#include <optional>
#include <string>
#include <vector>

namespace tavo {

// In no order, without "." and ".."; none of a folder that is not there. Empty when it cannot be read. Throws bad_alloc
// alone.
std::optional<std::vector<std::string>> FolderNames(const char *path);

}  // namespace tavo

#endif
