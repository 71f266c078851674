// Opens files safely for a library that runs as root: close-on-exec, EINTR retried, never waiting for the other end of
// a FIFO in place of a settings file.
#ifndef TAVO_CORE_DETAIL_OPEN_FILE_H
#define TAVO_CORE_DETAIL_OPEN_FILE_H

#include "core/detail/owner.h"

#include <string_view>

#include <fcntl.h>
#include <sys/stat.h>

namespace tavo {

// Group and others may never write to a file that the library creates. The caller's umask is ignored: the appliance's
// settings files have the same modes whichever program created them.
constexpr mode_t kWritableByOthers = S_IWGRP | S_IWOTH;
constexpr mode_t kPermissions = 07777;

// Restores the permissions of a new file that a strict umask has removed.
void RestoreMode(int fd, mode_t mode) noexcept;

// open(2) with O_CLOEXEC, O_NOCTTY and O_NONBLOCK added; empty with errno on failure. A file that it creates has
// exactly the mode, less kWritableByOthers.
Fd OpenFd(const char *path, int flags, mode_t mode = 0644) noexcept;

// The same for a regular file only: EISDIR for a directory, EINVAL for anything else.
Fd OpenRegular(const char *path, int flags, mode_t mode = 0644) noexcept;

// Opens a read stream on a regular file; empty with errno on failure.
File OpenToRead(const char *path) noexcept;

// Moves the file to a descriptor above 2, away from a child's standard descriptors, for a process that has closed its
// own. Empty with errno on failure.
Fd AboveStandard(Fd fd) noexcept;

// Writes all of `text`; retries EINTR and short writes.
bool WriteAll(int fd, std::string_view text) noexcept;

// fsync, retried on EINTR; true also for files without a disk (a terminal, a pipe).
bool SyncFd(int fd) noexcept;

}  // namespace tavo

#endif
