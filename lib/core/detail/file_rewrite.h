// The one way in which a settings or account file is replaced: a temporary file beside it, synced, with the old owner,
// mode and extended attributes, renamed over it. Whatever happens, the file is the old or the new one.
#ifndef TAVO_CORE_DETAIL_FILE_REWRITE_H
#define TAVO_CORE_DETAIL_FILE_REWRITE_H

#include "core/detail/open_file.h"
#include "core/detail/temp_file.h"

#include <string>
#include <string_view>

namespace tavo {

// Codes are those that the caller reports; 0 is success.
class FileRewrite {
  public:
    // Opens the file that is to be replaced: ERR_OPEN_FAILED (also when it is no regular file) or ERR_STAT_FAILED. A
    // file that does not exist is ERR_OPEN_FAILED with IsMissing(); Replace then creates it. A symbolic link is
    // followed, except in a directory that everybody may write to.
    int Open(const char *path);
    bool IsMissing() const noexcept { return missing_; }

    // The old text; false after a read error.
    bool Read(std::string &text);

    // ERR_OPEN_FAILED: no temporary file; ERR_WRITE_FAILED: it could not be completed (errno says why);
    // ERR_RENAME_FAILED. An existing file's owner and mode are kept, a new one gets `mode_of_new`, whatever the umask.
    int Replace(std::string_view text, mode_t mode_of_new = 0644);

    // The same through a temporary file elsewhere; when it lies on another file system, ERR_RENAME_FAILED with EXDEV.
    int ReplaceBy(TempFile &temp, std::string_view text, mode_t mode_of_new = 0644);

    // The first half of that, for callers who move several files together: the text, owner, mode and attributes go into
    // `temp`, which is synced and closed. False with errno.
    bool Complete(Fd &temp, std::string_view text, mode_t mode_of_new = 0666) noexcept;

    // Whether the last Replace also made its rename durable. It has taken place all the same.
    bool IsDirectorySynced() const noexcept { return directory_synced_; }

    // The file itself, behind any link.
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
