// The one gate to files in directories in which everybody may create names, such as /tmp: root neither writes to nor
// believes a file that another user has planted there, and no planted name stops it. Functions that open or move throw
// bad_alloc.
//
// A planted file is recognised: it is a link, a FIFO or a folder, it belongs to another user, or (a hard link) it has a
// second name elsewhere.
#ifndef TAVO_CORE_DETAIL_TRUSTED_FILE_H
#define TAVO_CORE_DETAIL_TRUSTED_FILE_H

#include "core/detail/owner.h"

#include <string>

#include <fcntl.h>
#include <sys/stat.h>

namespace tavo {

// True when everybody may create names in the directory that holds `path`. False when the directory cannot be examined.
bool IsInPublicDirectory(const char *path);

// Returns whether a file with this state is our own: it belongs to root or to the caller and, unless it is a directory,
// has only one name. `st` comes from fstat or lstat, never from stat, which follows links.
bool IsTrusted(const struct stat &st) noexcept;

// OpenFd, except that in a public directory it opens only regular files that are trusted (else EPERM, EISDIR, EINVAL or
// ELOOP). O_TRUNC empties a file only after that check.
Fd OpenTrusted(const char *path, int flags, mode_t mode = 0644);

// The same for a regular file in any directory.
Fd OpenTrustedRegular(const char *path, int flags, mode_t mode = 0644);

// Frees a name that the library needs in a public directory. An untrusted file there, of any kind, is renamed to
// another name beside it; the rename follows no link and reads no folder. Returns the new name for the log. Returns an
// empty text when there is nothing untrusted, or (for callers other than root) when it cannot be moved.
std::string MoveForeignAside(const std::string &path);

}  // namespace tavo

#endif
