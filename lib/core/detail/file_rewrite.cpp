// Replaces a whole file.
#include "core/detail/file_rewrite.h"

#include "tavo_error.h"

#include "core/detail/file_target.h"
#include "core/detail/line_reader.h"

#include <algorithm>
#include <new>

#include <sys/xattr.h>

namespace tavo {
namespace {

// Copies access lists, security labels and other extended attributes of the old file. Attributes that cannot be copied
// are left out: not every file system supports them, and the setting matters more than its label.
void CopyAttributes(int from, int to) noexcept
{
    char names[1024];
    char value[4096];
    const ssize_t length = ::flistxattr(from, names, sizeof names);
    for (const char *name = names; length > 0 && name < names + length; name += std::string_view(name).size() + 1) {
        const ssize_t size = ::fgetxattr(from, name, value, sizeof value);
        if (size >= 0)
            ::fsetxattr(to, name, value, static_cast<size_t>(size), 0);
    }
}

bool SyncDirectory(const std::string &path) noexcept
{
    const Fd directory = OpenFd(path.c_str(), O_RDONLY | O_DIRECTORY);
    return directory && SyncFd(directory.Get());
}

}  // namespace

Code FileRewrite::Open(const char *path)
{
    target_ = FileTarget(path);
    if (target_.empty())
        return ERR_OPEN_FAILED;
    old_ = OpenFd(target_.c_str(), O_RDONLY | O_NOFOLLOW);
    missing_ = !old_ && errno == ENOENT;
    if (!old_)
        return ERR_OPEN_FAILED;
    if (::fstat(old_.Get(), &state_) != 0)
        return ERR_STAT_FAILED;
    return S_ISREG(state_.st_mode) ? 0 : ERR_OPEN_FAILED;
}

bool FileRewrite::Read(std::string &text)
{
    // The size is a hint: files under /proc have none, others may grow.
    const auto hint = static_cast<size_t>(std::clamp<off_t>(state_.st_size, 0, kLargestText));
    text.resize(std::max<size_t>(hint + 1, 4096));
    for (size_t length = 0;;) {
        if (length == text.size()) {
            if (length > kLargestText)
                throw std::bad_alloc();
            text.resize(length * 2);
        }
        const ssize_t got = ::read(old_.Get(), text.data() + length, text.size() - length);
        if (got < 0 && errno == EINTR)
            continue;
        length += got > 0 ? static_cast<size_t>(got) : 0;
        if (got <= 0) {
            text.resize(length);
            return got == 0;
        }
    }
}

bool FileRewrite::Complete(Fd &temp, std::string_view text, mode_t mode_of_new) noexcept
{
    const int fd = temp.Get();
    if (!WriteAll(fd, text))
        return false;
    if (missing_) {
        if (::fchmod(fd, mode_of_new & ~kWritableByOthers) != 0)
            return false;
    } else {
        struct stat made;
        if (::fstat(fd, &made) != 0)
            return false;
        const bool same_owner = made.st_uid == state_.st_uid && made.st_gid == state_.st_gid;
        if (!same_owner && ::fchown(fd, state_.st_uid, state_.st_gid) != 0)
            return false;
        CopyAttributes(old_.Get(), fd);
        if (::fchmod(fd, state_.st_mode & kPermissions) != 0)
            return false;
    }
    // Last, so that the one sync covers owner and mode too.
    return SyncFd(fd) && temp.Close();
}

Code FileRewrite::ReplaceBy(TempFile &temp, std::string_view text, mode_t mode_of_new)
{
    const std::string directory = DirectoryOf(target_);
    if (!Complete(temp.File(), text, mode_of_new))
        return ERR_WRITE_FAILED;
    if (!temp.RenameTo(target_))
        return ERR_RENAME_FAILED;
    directory_synced_ = SyncDirectory(directory);
    return 0;
}

Code FileRewrite::Replace(std::string_view text, mode_t mode_of_new)
{
    TempFile temp;
    if (!temp.CreateBeside(target_))
        return ERR_OPEN_FAILED;
    return ReplaceBy(temp, text, mode_of_new);
}

}  // namespace tavo
