// Reads the names in a folder. A folder that cannot be read to its end is reported as a failure: on a dying disk it
// must not look empty.
//
//     FolderReader folder(path);
//     while (const char *name = folder.Next())
//         ...
//     if (folder.Failed())  // errno says why
#ifndef TAVO_CORE_DETAIL_FOLDER_READER_H
#define TAVO_CORE_DETAIL_FOLDER_READER_H

#include "core/detail/owner.h"

#include <dirent.h>

namespace tavo {

class FolderReader {
  public:
    // Follows a link to a folder. A folder that cannot be opened has no names and has Failed.
    explicit FolderReader(const char *path) noexcept;

    // Takes ownership of an open folder. Reading moves the descriptor's position, which others may share.
    explicit FolderReader(Fd folder) noexcept;
    ~FolderReader();
    FolderReader(const FolderReader &) = delete;
    FolderReader &operator=(const FolderReader &) = delete;

    // Returns the next name except "." and "..", in no order; valid until the next call. NULL at the end and after a
    // read error.
    const char *Next() noexcept;

    // To be asked after the last name: whether some names could not be read; errno has the reason.
    bool Failed() const noexcept;

    // For the *at functions; -1 when the folder cannot be opened.
    int Descriptor() const noexcept { return folder_ ? ::dirfd(folder_) : -1; }

  private:
    DIR *folder_ = nullptr;
    int error_ = 0;
};

}  // namespace tavo

#endif
