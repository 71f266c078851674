// The names in a folder.
#ifndef TAVO_NETWORK_DETAIL_FOLDER_NAMES_H
#define TAVO_NETWORK_DETAIL_FOLDER_NAMES_H

#include <string>
#include <vector>

namespace tavo {

// In no order, without "." and ".."; empty for a folder that cannot be read. Throws bad_alloc alone.
std::vector<std::string> FolderNames(const char *path);

}  // namespace tavo

#endif
