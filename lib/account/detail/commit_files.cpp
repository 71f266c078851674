// The files of a commit, one by one.
#include "account/detail/commit_files.h"

#include "core/detail/open_file.h"

#include <algorithm>
#include <filesystem>
#include <string_view>

#include <limits.h>

namespace tavo {
namespace {

std::string_view FolderOf(const FileStep &file)
{
    return std::string_view(file.path).substr(0, file.path.rfind('/'));
}

bool SyncFolder(std::string_view folder) noexcept
{
    char path[PATH_MAX];
    if (folder.size() >= sizeof path)
        return false;
    path[folder.copy(path, folder.size())] = 0;
    const Fd fd = OpenFd(path, O_RDONLY | O_DIRECTORY);
    return fd && SyncFd(fd.Get());
}

}  // namespace

Fd CreateTemporary(const char *path, bool makes_folder)
{
    constexpr int flags = O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW;  // Samba's file is read again
    ::unlink(path);
    Fd fd = OpenFd(path, flags, 0600);
    if (fd || errno != ENOENT || !makes_folder)
        return fd;
    const std::filesystem::path parent = std::filesystem::path(path).parent_path();
    std::error_code error;
    std::filesystem::create_directories(parent.parent_path(), error);
    if (!error)
        ::mkdir(parent.c_str(), 0700);
    return OpenFd(path, flags, 0600);
}

bool IsWhole(const FileStep &file)
{
    return FileIdentity(file.temporary.c_str()) == file.made;
}

bool MoveIntoPlace(const FileStep &file) noexcept
{
    return ::rename(file.temporary.c_str(), file.path.c_str()) == 0;
}

bool SyncFolders(const std::vector<FileStep> &files) noexcept
{
    bool synced = true;
    for (auto file = files.begin(); file != files.end(); ++file) {
        const std::string_view folder = FolderOf(*file);
        if (std::none_of(files.begin(), file, [&](const FileStep &other) { return FolderOf(other) == folder; }))
            synced = SyncFolder(folder) && synced;
    }
    return synced;
}

}  // namespace tavo
