// Opens files in the one way that suits a library which runs as root: close-on-exec, EINTR retried, never waiting for
// the other end of a FIFO that somebody left where a settings file belongs.
#ifndef TAVO_CORE_DETAIL_OPEN_FILE_H
#define TAVO_CORE_DETAIL_OPEN_FILE_H

#include "core/detail/owner.h"

#include <string_view>

#include <fcntl.h>
#include <sys/stat.h>

namespace tavo {

// Nothing that the library creates may be written to by group or others. The caller's umask counts for nothing: settings
// files of the appliance have the same modes whichever program made them.
constexpr mode_t kWritableByOthers = S_IWGRP | S_IWOTH;
constexpr mode_t kPermissions = 07777;

// Gives a file that was just created the permissions that a strict umask has taken from it.
void RestoreMode(int fd, mode_t mode) noexcept;

// open(2) with O_CLOEXEC, O_NOCTTY and O_NONBLOCK added; empty with errno on failure. A file that it creates has exactly
// the mode, less kWritableByOthers.
Fd OpenFd(const char *path, int flags, mode_t mode = 0644) noexcept;

// The same for a regular file only: EISDIR for a directory, EINVAL for anything else that is no regular file.
Fd OpenRegular(const char *path, int flags, mode_t mode = 0644) noexcept;

// A read stream on a regular file; empty with errno on failure.
File OpenToRead(const char *path) noexcept;

// The same file on a descriptor above 2, out of the way of a child's standard descriptors: for a process that has closed its
// own. Empty with errno on failure.
Fd AboveStandard(Fd fd) noexcept;

// Writes all of `text`; EINTR and short writes are retried.
bool WriteAll(int fd, std::string_view text) noexcept;

// fsync, retried on EINTR; true also for what has no disk behind it (a terminal, a pipe).
bool SyncFd(int fd) noexcept;

}  // namespace tavo

#endif
