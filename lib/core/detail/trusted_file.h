// The one gate to files in directories in which everybody may create names, such as /tmp: root neither writes to nor
// believes a file there that somebody else has planted, and no planted name stops it. What opens or moves throws bad_alloc.
//
// A planted file betrays itself: it is a link, a FIFO or a folder, it belongs to somebody else, or (a hard link) it has
// a second name elsewhere.
#ifndef TAVO_CORE_DETAIL_TRUSTED_FILE_H
#define TAVO_CORE_DETAIL_TRUSTED_FILE_H

#include "core/detail/owner.h"

#include <string>

#include <fcntl.h>
#include <sys/stat.h>

namespace tavo {

// True when everybody may create names in the directory that holds `path`. False when the directory cannot be looked
// at.
bool IsInPublicDirectory(const char *path);

// Whether a file with this state is our own: it belongs to root or to the caller and, unless it is a directory, has one
// name only. `st` comes from fstat or lstat, never from stat, which follows links.
bool IsTrusted(const struct stat &st) noexcept;

// OpenFd, except that a public directory yields only regular files that IsTrusted (else EPERM, EISDIR, EINVAL or
// ELOOP). O_TRUNC empties a file only after that check.
Fd OpenTrusted(const char *path, int flags, mode_t mode = 0644);

// The same for a regular file, wherever it is.
Fd OpenTrustedRegular(const char *path, int flags, mode_t mode = 0644);

// Frees a name that the library needs in a public directory: what is there and not IsTrusted gets another name beside
// it, whatever it is, by one rename that follows no link and looks into no folder. Returns that name, for the log; an
// empty text when nothing foreign is there or (for callers other than root) when it cannot be moved.
std::string MoveForeignAside(const std::string &path);

}  // namespace tavo

#endif
