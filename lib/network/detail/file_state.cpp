// Files as they were before a change, to be put back when it fails.
#include "network/detail/file_state.h"

#include "tavo_error.h"

#include "core/detail/file_rewrite.h"
#include "network/detail/folder_names.h"
#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"

#include <algorithm>
#include <cerrno>

namespace tavo {
namespace {

constexpr std::string_view kStem = "ifcfg-";

std::optional<std::vector<std::string>> InterfaceFiles()
{
    const auto names = FolderNames(kInterfaceFolder);
    if (!names)
        return std::nullopt;
    std::vector<std::string> paths;
    for (const std::string &name : *names) {
        if (name.starts_with(kStem))
            paths.push_back(kInterfaceFolder + name);
    }
    std::sort(paths.begin(), paths.end());
    return paths;
}

}  // namespace

std::optional<FileState> ReadFileState(const std::string &path)
{
    FileState file{path, ReadKernelFile(path.c_str()), 0644};
    struct stat st;
    if (!file.text && errno != ENOENT)
        return std::nullopt;
    if (file.text && ::stat(path.c_str(), &st) == 0)
        file.mode = st.st_mode & 07777;
    return file;
}

int PutBack(const FileState &file)
{
    if (!file.text)
        return ::unlink(file.path.c_str()) == 0 || errno == ENOENT ? 0 : ERR_REMOVE_FAILED;
    if (ReadKernelFile(file.path.c_str()) == file.text)
        return 0;
    FileRewrite rewrite;
    if (const int code = rewrite.Open(file.path.c_str()); code != 0 && !rewrite.IsMissing())
        return code;
    return rewrite.Replace(*file.text, file.mode);
}

std::optional<std::vector<FileState>> ReadInterfaceFiles()
{
    const auto paths = InterfaceFiles();
    if (!paths)
        return std::nullopt;
    std::vector<FileState> files;
    for (const std::string &path : *paths) {
        auto file = ReadFileState(path);
        if (!file)
            return std::nullopt;
        files.push_back(std::move(*file));
    }
    return files;
}

}  // namespace tavo
