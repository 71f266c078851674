// Turns the lines of a key into comments.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"
#include "core/detail/rewrite_report.h"

#include <sys/file.h>

namespace {

// /etc/skel is copied into every new home directory, so the scratch file must not remain.
constexpr const char *kScratch = "/etc/skel/tempErrTLIBFileComment";

std::optional<std::string> WithComments(std::string_view text, std::string_view key)
{
    const size_t old_size = text.size();
    std::string changed;
    changed.reserve(old_size + 1);
    while (!text.empty()) {
        const std::string_view line = tavo::TakeWholeLine(text);
        if (tavo::LineSetsKey(line, key))
            changed += ';';
        changed += line;
    }
    if (changed.size() == old_size)
        return std::nullopt;
    return changed;
}

// Marks the scratch file as in use; 0 or errno.
int Lock(const tavo::Fd &fd)
{
    while (::flock(fd.Get(), LOCK_EX | LOCK_NB) != 0) {
        if (errno != EINTR)
            return errno;
    }
    return 0;
}

// Checks that the path still names that file, and that no other process has it.
bool IsScratch(const tavo::Fd &fd)
{
    struct stat open_file, named;
    return ::fstat(fd.Get(), &open_file) == 0 && ::lstat(kScratch, &named) == 0 && open_file.st_dev == named.st_dev &&
           open_file.st_ino == named.st_ino && open_file.st_uid == ::geteuid() && open_file.st_nlink == 1;
}

// Removes the file of a process that died. Anything else of that name belongs to others and stays.
bool RemoveStale()
{
    const tavo::Fd fd = tavo::OpenRegular(kScratch, O_RDONLY | O_NOFOLLOW);
    return fd && Lock(fd) == 0 && IsScratch(fd) && ::unlink(kScratch) == 0;
}

tavo::Fd CreateScratch()
{
    constexpr int how = O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW;
    tavo::Fd fd = tavo::OpenFd(kScratch, how, 0600);
    if (!fd && errno == EEXIST && RemoveStale())
        fd = tavo::OpenFd(kScratch, how, 0600);
    if (!fd)
        return fd;
    const int error = Lock(fd);
    if (error == 0 && IsScratch(fd))
        return fd;
    // If it is locked by now, another process has just found it stale and removes it.
    if (error != 0 && error != EWOULDBLOCK && IsScratch(fd))
        ::unlink(kScratch);
    return tavo::Fd();
}

bool OnSameFileSystem(int fd, const std::string &path)
{
    struct stat scratch, target;
    return ::fstat(fd, &scratch) == 0 && ::stat(path.c_str(), &target) == 0 && scratch.st_dev == target.st_dev;
}

// False when the scratch file cannot be used; then the file is rewritten like any other.
bool ReplaceByScratch(tavo::FileRewrite &rewrite, std::string_view text)
{
    std::string path = kScratch;            // allocated first: once created, the file needs its owner
    const tavo::Fd lock = CreateScratch();  // held beyond the rename
    if (!lock)
        return false;
    tavo::TempFile temp;
    temp.Adopt(tavo::Fd(::fcntl(lock.Get(), F_DUPFD_CLOEXEC, 0)), std::move(path));
    return OnSameFileSystem(lock.Get(), rewrite.Target()) && rewrite.ReplaceBy(temp, text) == 0;
}

}  // namespace

extern "C" int TLIBFileComment(const char *szPath, const char *szKey)
{
    if (!szPath || !szKey)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::FileRewrite rewrite;
        std::string text;
        if (tavo::ReadOrFail(rewrite, szPath, text) != 0)
            return -1;
        const std::optional<std::string> changed = WithComments(text, szKey);
        if (!changed)
            return FailNone(ERR_KEY_NOT_FOUND);
        if (ReplaceByScratch(rewrite, *changed)) {
            tavo::LogUnsyncedDirectory(rewrite);
            return 1;
        }
        return tavo::ReplaceOrFail(rewrite, *changed) == 0 ? 1 : -1;
    });
}
