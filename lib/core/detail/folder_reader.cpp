// Reads the names in a folder.
#include "core/detail/folder_reader.h"

#include "core/detail/open_file.h"

#include <string_view>

namespace tavo {

FolderReader::FolderReader(const char *path) noexcept : FolderReader(OpenFd(path, O_RDONLY | O_DIRECTORY))
{
}

FolderReader::FolderReader(Fd folder) noexcept
{
    if (folder && (folder_ = ::fdopendir(folder.Get())) != nullptr)
        folder.Release();
    else
        error_ = errno;
}

FolderReader::~FolderReader()
{
    KeepErrno keep;
    if (folder_)
        ::closedir(folder_);
}

const char *FolderReader::Next() noexcept
{
    while (folder_ && error_ == 0) {
        errno = 0;
        const dirent *const entry = ::readdir(folder_);
        if (!entry) {
            error_ = errno;
            break;
        }
        const std::string_view name = entry->d_name;
        if (name != "." && name != "..")
            return entry->d_name;
    }
    return nullptr;
}

bool FolderReader::Failed() const noexcept
{
    if (error_ != 0)
        errno = error_;
    return error_ != 0;
}

}  // namespace tavo
