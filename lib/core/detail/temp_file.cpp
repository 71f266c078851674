// Moves a temporary file into its target's place.
#include "core/detail/temp_file.h"

#include "core/detail/file_target.h"
#include "core/detail/folder_reader.h"

#include <cstdint>
#include <cstdlib>
#include <new>
#include <string_view>
#include <utility>

#include <sys/file.h>
#include <sys/random.h>

namespace tavo {
namespace {

constexpr char kLetters[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789";
constexpr size_t kHalf = 3;
constexpr size_t kEnding = 1 + 2 * kHalf;  // a dot and six characters
constexpr int kNameTries = 16;

void AppendDigits(std::string &text, uint32_t number)
{
    for (size_t i = 0; i < kHalf; ++i, number /= 62)
        text += kLetters[number % 62];
}

uint32_t HashOf(std::string_view text) noexcept
{
    uint32_t hash = 2166136261u;
    for (const char c : text)
        hash = (hash ^ static_cast<unsigned char>(c)) * 16777619u;
    return hash;
}

// Three random characters, and three that follow from the name so far: "hosts.backup" is a user's file and must not be
// mistaken for a stale temporary file of "hosts".
std::string TempName(std::string_view target_name, std::string_view random)
{
    std::string name(target_name);
    name += '.';
    name += random;
    AppendDigits(name, HashOf(name));
    return name;
}

bool IsTempName(std::string_view name, std::string_view target_name)
{
    return name.size() == target_name.size() + kEnding && name.starts_with(target_name) &&
           name == TempName(target_name, name.substr(target_name.size() + 1, kHalf));
}

std::string_view LastPart(std::string_view path) noexcept
{
    return path.substr(path.rfind('/') + 1);  // npos + 1 is 0
}

// The lock's holder owns the file; a death releases it.
bool LockTemp(int fd) noexcept
{
    while (::flock(fd, LOCK_EX | LOCK_NB) != 0) {
        if (errno != EINTR)
            return errno != EWOULDBLOCK;  // on a file system without locks no other process takes any
    }
    return true;
}

bool IsNamed(int fd, int directory, const char *name) noexcept
{
    struct stat open_file, named;
    return ::fstat(fd, &open_file) == 0 && ::fstatat(directory, name, &named, AT_SYMLINK_NOFOLLOW) == 0 &&
           open_file.st_dev == named.st_dev && open_file.st_ino == named.st_ino;
}

bool IsDead(int fd, int directory, const char *name) noexcept
{
    struct stat st;
    return ::fstat(fd, &st) == 0 && S_ISREG(st.st_mode) && st.st_nlink == 1 && ::flock(fd, LOCK_EX | LOCK_NB) == 0 &&
           IsNamed(fd, directory, name);
}

// Removes the temporary file of a process that was killed while it rewrote the target.
void RemoveDead(const std::string &target)
{
    FolderReader folder(DirectoryOf(target).c_str());
    while (const char *const name = folder.Next()) {
        if (!IsTempName(name, LastPart(target)))
            continue;
        const Fd fd(::openat(folder.Descriptor(), name, O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
        if (fd && IsDead(fd.Get(), folder.Descriptor(), name))
            ::unlinkat(folder.Descriptor(), name, 0);
    }
    if (folder.Failed() && errno == ENOMEM)
        throw std::bad_alloc();
}

}  // namespace

bool TempFile::CreateBeside(const std::string &target)
{
    Remove();
    RemoveDead(target);
    const std::string directory = DirectoryOf(target);
    for (int tries = 0; tries < kNameTries; ++tries) {
        uint32_t number = 0;
        if (::getrandom(&number, sizeof number, GRND_NONBLOCK) < 0)
            number = static_cast<uint32_t>(::getpid() + tries);
        std::string random;
        AppendDigits(random, number);
        path_ = directory == "/" ? "/" : directory + "/";
        path_ += TempName(LastPart(target), random);
        fd_ = OpenFd(path_.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
        if (!fd_ && errno == EEXIST)
            continue;
        if (!fd_)
            break;
        // Another process may have removed it as stale between the two calls.
        if (LockTemp(fd_.Get())) {
            errno = 0;
            if (IsNamed(fd_.Get(), AT_FDCWD, path_.c_str()))
                break;
            if (errno != 0 && errno != ENOENT) {
                Remove();
                break;
            }
        }
        fd_.Reset();
    }
    if (!fd_)
        path_.clear();
    return static_cast<bool>(fd_);
}

void TempFile::Adopt(Fd fd, std::string path)
{
    Remove();
    fd_ = std::move(fd);
    path_ = std::move(path);
}

bool TempFile::Close() noexcept
{
    lock_.Reset(::fcntl(fd_.Get(), F_DUPFD_CLOEXEC, 0));
    return fd_.Close();
}

bool TempFile::RenameTo(const std::string &target) noexcept
{
    if (::rename(path_.c_str(), target.c_str()) != 0)
        return false;
    path_.clear();
    return true;
}

void TempFile::Remove() noexcept
{
    KeepErrno keep;
    if (!path_.empty())
        ::unlink(path_.c_str());
    path_.clear();
    fd_.Reset();
    lock_.Reset();
}

}  // namespace tavo
