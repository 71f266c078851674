// Opens the log files of the error family.
#ifndef TAVO_CORE_DETAIL_LOG_FILE_H
#define TAVO_CORE_DETAIL_LOG_FILE_H

#include "core/detail/open_file.h"

namespace tavo {

// A device or a FIFO is a legal place for a log. In a directory that everybody may write to only a regular file is,
// and no link: it may have been put there to have root append to something else.
inline Fd OpenLogFile(const char *path, int flags)
{
    return IsInPublicDirectory(path) ? OpenRegular(path, flags | O_NOFOLLOW) : OpenFd(path, flags);
}

}  // namespace tavo

#endif
