// The names in a folder.
#include "network/detail/folder_names.h"

#include "core/detail/open_file.h"

#include <memory>

#include <dirent.h>

namespace tavo {
namespace {

struct CloseFolder {
    void operator()(DIR *folder) const noexcept
    {
        KeepErrno keep;
        ::closedir(folder);
    }
};

}  // namespace

std::vector<std::string> FolderNames(const char *path)
{
    std::vector<std::string> names;
    Fd fd = OpenFd(path, O_RDONLY | O_DIRECTORY);
    if (!fd)
        return names;
    const std::unique_ptr<DIR, CloseFolder> folder(::fdopendir(fd.Get()));
    if (!folder)
        return names;
    fd.Release();
    while (const dirent *const entry = ::readdir(folder.get())) {
        std::string name = entry->d_name;
        if (name != "." && name != "..")
            names.push_back(std::move(name));
    }
    return names;
}

}  // namespace tavo
