// The names in a folder of /sys, /proc or /dev.
#include "frame/folder_names.h"

#include "frame/failure.h"

#include <algorithm>
#include <cerrno>
#include <memory>
#include <string_view>

#include <dirent.h>

namespace tavoctl {
namespace {

struct CloseFolder {
    void operator()(DIR *folder) const { ::closedir(folder); }
};

}  // namespace

std::vector<std::string> FolderNames(const std::string &path)
{
    const std::string attempted = "list " + path;
    const std::unique_ptr<DIR, CloseFolder> folder(::opendir(path.c_str()));
    if (!folder) {
        if (errno == ENOENT || errno == ENOTDIR)
            return {};
        throw SystemFailure(attempted, errno);
    }
    std::vector<std::string> names;
    for (;;) {
        errno = 0;
        const dirent *entry = ::readdir(folder.get());
        if (!entry)
            break;
        const std::string_view name = entry->d_name;
        if (name != "." && name != "..")
            names.emplace_back(name);
    }
    if (errno != 0)
        throw SystemFailure(attempted, errno);
    std::sort(names.begin(), names.end());
    return names;
}

}  // namespace tavoctl
