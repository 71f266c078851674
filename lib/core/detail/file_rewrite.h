// The only way in which the library replaces a settings or account file: a temporary file beside it, synced, with the
// old owner, mode and extended attributes, renamed over it. After any failure the file is the old or the new one.
#ifndef TAVO_CORE_DETAIL_FILE_REWRITE_H
#define TAVO_CORE_DETAIL_FILE_REWRITE_H

#include "core/detail/open_file.h"
#include "core/detail/result.h"
#include "core/detail/temp_file.h"

#include <string>
#include <string_view>

namespace tavo {

class FileRewrite {
  public:
    // Opens the file to be replaced: ERR_OPEN_FAILED (also when it is not a regular file) or ERR_STAT_FAILED. A missing
    // file is ERR_OPEN_FAILED with IsMissing(); Replace then creates it. A symbolic link is followed, except in a
    // directory that everybody may write to.
    Code Open(const char *path);
    bool IsMissing() const noexcept { return missing_; }

    // Reads the old text; false after a read error.
    bool Read(std::string &text);

    // ERR_OPEN_FAILED: no temporary file; ERR_WRITE_FAILED: it could not be completed (errno has the reason);
    // ERR_RENAME_FAILED. An existing file keeps its owner and mode. A new one gets `mode_of_new`, whatever the umask.
    Code Replace(std::string_view text, mode_t mode_of_new = 0644);

    // The same through a temporary file elsewhere; ERR_RENAME_FAILED with EXDEV when it is on another file system.
    Code ReplaceBy(TempFile &temp, std::string_view text, mode_t mode_of_new = 0644);

    // The first half of that, for callers that rename several files together: writes text, owner, mode and attributes
    // to `temp`, syncs and closes it. False with errno.
    bool Complete(Fd &temp, std::string_view text, mode_t mode_of_new = 0666) noexcept;

    // Returns whether the last Replace also made its rename durable. The rename has happened either way.
    bool IsDirectorySynced() const noexcept { return directory_synced_; }

    // The path of the file itself, with links followed.
    const std::string &Target() const noexcept { return target_; }

  private:
    Fd old_;
    struct stat state_ {};
    std::string target_;
    bool missing_ = false;
    bool directory_synced_ = true;
};

}  // namespace tavo

#endif
