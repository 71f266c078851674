// The names in a folder.
#include "network/detail/folder_names.h"

#include "core/detail/folder_reader.h"

#include <cerrno>

namespace tavo {

std::optional<std::vector<std::string>> FolderNames(const char *path)
{
    std::vector<std::string> names;
    FolderReader folder(path);
    while (const char *const name = folder.Next())
        names.emplace_back(name);
    if (folder.Failed() && errno != ENOENT)
        return std::nullopt;
    return names;
}

}  // namespace tavo
