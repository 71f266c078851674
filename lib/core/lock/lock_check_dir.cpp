// Creates the directory of the lock files and every lock file that is missing.
//
// Everybody may create names in /tmp, also before the appliance does. Root follows no link there, waits for no FIFO,
// takes no lock in a directory in which another user could exchange the files, and renames other users' directories.
#include "tavo_lock.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/trusted_file.h"

namespace {

using tavo::Fd;

constexpr char kDirectory[] = "/tmp/lock";
constexpr mode_t kDirectoryMode = 0755;
constexpr mode_t kFileMode = 0600;  // every reader of the file could hold its lock for ever
constexpr int kTries = 64;          // against a user who takes the name again and again

bool IsOwnerTrusted(const struct stat &st)
{
    return st.st_uid == 0 || st.st_uid == ::geteuid();
}

Fd OpenOrCreateDirectory()
{
    Fd fd(::open(kDirectory, O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    if (!fd && errno == ENOENT) {
        const bool created = ::mkdir(kDirectory, 0700) == 0;
        if (!created && errno != EEXIST)
            return Fd();
        fd.Reset(::open(kDirectory, O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
        if (fd && created && ::fchmod(fd.Get(), kDirectoryMode) != 0)
            return Fd();
    }
    struct stat st;
    if (!fd || ::fstat(fd.Get(), &st) != 0 || !IsOwnerTrusted(st) || (st.st_mode & (S_IWGRP | S_IWOTH)) != 0)
        return Fd();
    return fd;
}

Fd OpenDirectory()
{
    for (int tries = 0; tries < kTries; ++tries) {
        Fd fd = OpenOrCreateDirectory();
        if (fd || ::geteuid() != 0)
            return fd;
        const std::string aside = tavo::MoveForeignAside(kDirectory);
        if (aside.empty())
            return Fd();
        LogError("%s:%d %s did not belong to root and was renamed to %s", kDirectory, aside);
    }
    return Fd();
}

bool IsLockFile(int directory, const char *name)
{
    struct stat st;
    if (::fstatat(directory, name, &st, AT_SYMLINK_NOFOLLOW) != 0 || !S_ISREG(st.st_mode) || !IsOwnerTrusted(st))
        return false;
    // Earlier releases let everybody read the lock files. Other users cannot exchange them in this directory.
    return (st.st_mode & 077) == 0 || st.st_uid != ::geteuid() || ::fchmodat(directory, name, kFileMode, 0) == 0;
}

bool CreateLockFile(int directory, const char *name)
{
    const Fd fd(::openat(directory, name, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC,
                         kFileMode));
    if (fd)
        return ::fchmod(fd.Get(), kFileMode) == 0;  // whatever the umask of the first caller
    return errno == EEXIST && IsLockFile(directory, name);
}

}  // namespace

extern "C" int ErrTLIBILockCheckDir(void)
{
    return Guard([] {
        const Fd directory = OpenDirectory();
        if (!directory)
            return Fail(ERR_CREATE_FAILED, Line{37});
        for (const TLIBLOCKFILE *entry = rgslckList; entry->fLockBit != 0; ++entry) {
            const char *const name = entry->szPath + sizeof kDirectory;
            if (!IsLockFile(directory.Get(), name) && !CreateLockFile(directory.Get(), name))
                return Fail(ERR_OPEN_FAILED, Line{45});
        }
        return 0;
    });
}
