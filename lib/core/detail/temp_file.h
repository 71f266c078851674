// A temporary file beside the file that it will replace.
#ifndef TAVO_CORE_DETAIL_TEMP_FILE_H
#define TAVO_CORE_DETAIL_TEMP_FILE_H

#include "core/detail/open_file.h"

#include <string>

namespace tavo {

// A file that will take another one's place; otherwise it is removed. While its process lives it is locked (flock). The
// next rewrite of the same target removes unlocked ones, which killed processes have left.
class TempFile {
  public:
    TempFile() = default;
    ~TempFile() { Remove(); }
    TempFile(const TempFile &) = delete;
    TempFile &operator=(const TempFile &) = delete;

    // Creates the target's path followed by a dot and six characters, mode 0600. Throws bad_alloc.
    bool CreateBeside(const std::string &target);

    // Takes ownership of a file that the caller created.
    void Adopt(Fd fd, std::string path);

    int Descriptor() const noexcept { return fd_.Get(); }
    Fd &File() noexcept { return fd_; }
    const std::string &Path() const noexcept { return path_; }

    // Closes; false when the kernel could not store everything. The lock stays.
    bool Close() noexcept;

    bool RenameTo(const std::string &target) noexcept;
    void Remove() noexcept;

  private:
    Fd fd_;
    Fd lock_;           // holds the lock after Close
    std::string path_;  // empty when there is no file to remove
};

}  // namespace tavo

#endif
