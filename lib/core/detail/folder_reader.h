// Reads the names in a folder. A folder that cannot be read to its end is a failure of its own: on a dying disk it must
// not pass for an empty one.
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
    // A link to a folder is followed. A folder that cannot be opened has no names and has Failed.
    explicit FolderReader(const char *path) noexcept;

    // Takes an open folder over, which must not be at a place that matters to others who share its descriptor.
    explicit FolderReader(Fd folder) noexcept;
    ~FolderReader();
    FolderReader(const FolderReader &) = delete;
    FolderReader &operator=(const FolderReader &) = delete;

    // The next name but "." and "..", in no order; valid until the next call. NULL at the end and after a read error.
    const char *Next() noexcept;

    // After the last name: whether something was left unread, errno then says why.
    bool Failed() const noexcept;

    // For the *at functions; -1 when the folder cannot be opened.
    int Descriptor() const noexcept { return folder_ ? ::dirfd(folder_) : -1; }

  private:
    DIR *folder_ = nullptr;
    int error_ = 0;
};

}  // namespace tavo

#endif
