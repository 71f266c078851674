// The contents of some folders, as a value that can be compared and restored.
#include "support/file_snapshot.h"

#include "support/test.h"

#include <climits>

namespace test {
namespace {

bool Untouched(const struct stat &left, const struct stat &right)
{
    return left.st_ino == right.st_ino && left.st_mode == right.st_mode && left.st_size == right.st_size &&
           left.st_uid == right.st_uid && left.st_gid == right.st_gid && left.st_mtim.tv_sec == right.st_mtim.tv_sec &&
           left.st_mtim.tv_nsec == right.st_mtim.tv_nsec && left.st_ctim.tv_sec == right.st_ctim.tv_sec &&
           left.st_ctim.tv_nsec == right.st_ctim.tv_nsec;
}

std::string ContentOf(const std::string &path, const struct stat &facts)
{
    if (S_ISREG(facts.st_mode)) {
        std::ifstream in(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(in), {}};
    }
    if (S_ISLNK(facts.st_mode)) {
        char target[PATH_MAX];
        const ssize_t length = ::readlink(path.c_str(), target, sizeof target);
        return std::string(target, length > 0 ? static_cast<size_t>(length) : 0);
    }
    return {};
}

// Mounted file systems are left out: in a tree that was cloned into /tmp, they hold the build with this program.
void AddFolder(const std::string &folder, dev_t device, const KeptFiles &known, KeptFiles &files)
{
    std::error_code none;
    for (const auto &entry : std::filesystem::directory_iterator(folder, none)) {
        const std::string path = entry.path();
        KeptFile file = {};
        if (::lstat(path.c_str(), &file.facts) != 0 || file.facts.st_dev != device)
            continue;
        const auto before = known.find(path);
        file.content = before != known.end() && Untouched(before->second.facts, file.facts)
                           ? before->second.content
                           : ContentOf(path, file.facts);
        const bool is_folder = S_ISDIR(file.facts.st_mode);
        files[path] = std::move(file);
        if (is_folder)
            AddFolder(path, device, known, files);
    }
}

void PutBack(const std::string &path, KeptFile &file)
{
    std::error_code none;
    struct stat now;
    const bool is_folder = S_ISDIR(file.facts.st_mode);
    if (::lstat(path.c_str(), &now) == 0 && (now.st_mode & S_IFMT) != (file.facts.st_mode & S_IFMT))
        std::filesystem::remove_all(path, none);
    if (is_folder) {
        std::filesystem::create_directory(path, none);
    } else if (S_ISLNK(file.facts.st_mode)) {
        std::filesystem::remove(path, none);
        std::filesystem::create_symlink(file.content, path, none);
    } else if (S_ISREG(file.facts.st_mode)) {
        WriteFile(path, file.content);
    }
    if (::lchown(path.c_str(), file.facts.st_uid, file.facts.st_gid) == 0 && !S_ISLNK(file.facts.st_mode))
        ::chmod(path.c_str(), file.facts.st_mode & 07777);
    const timespec times[] = {file.facts.st_atim, file.facts.st_mtim};
    ::utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW);
    ::lstat(path.c_str(), &file.facts);
}

}  // namespace

FileSnapshot::FileSnapshot(std::vector<std::string> folders) : folders_(std::move(folders))
{
    files_ = Now();
}

KeptFiles FileSnapshot::Now() const
{
    KeptFiles files;
    struct stat facts;
    for (const std::string &folder : folders_) {
        if (::stat(folder.c_str(), &facts) == 0)
            AddFolder(folder, facts.st_dev, files_, files);
    }
    return files;
}

void FileSnapshot::Restore()
{
    std::error_code none;
    const KeptFiles now = Now();
    for (auto file = now.rbegin(); file != now.rend(); ++file) {  // a folder's contents before the folder
        if (!files_.contains(file->first))
            std::filesystem::remove(file->first, none);
    }
    for (auto &[path, file] : files_) {
        const auto found = now.find(path);
        if (found == now.end() || !found->second.SameContent(file) ||
            found->second.facts.st_mode != file.facts.st_mode || found->second.facts.st_uid != file.facts.st_uid ||
            found->second.facts.st_gid != file.facts.st_gid ||
            (!S_ISDIR(file.facts.st_mode) && !Untouched(found->second.facts, file.facts)))
            PutBack(path, file);
    }
}

}  // namespace test
