// Replaces the text files of an account family together. Each new file is written and synced beside the old one; then a
// marker that names them all is made durable, they are moved into place one by one, and the marker goes. A death before
// the marker leaves the old files, one behind it is made good by FinishCommit at the next open: never some of each.
// A file that would become what it is stays. Where only one changes, moving it into place is all or nothing by itself.
#ifndef TAVO_ACCOUNT_DETAIL_TEXT_COMMIT_H
#define TAVO_ACCOUNT_DETAIL_TEXT_COMMIT_H

#include "account/detail/store_family.h"

#include <string>
#include <string_view>
#include <vector>

namespace tavo {

class TextCommit {
  public:
    explicit TextCommit(const StoreFamily &family) : family_(family) {}
    ~TextCommit();  // what was not committed is removed
    TextCommit(const TextCommit &) = delete;
    TextCommit &operator=(const TextCommit &) = delete;

    // Writes the next generation of one file, with the owner and mode of the old one. 0, ERR_OPEN_FAILED,
    // ERR_WRITE_FAILED or ERR_NOT_ENOUGH_SPACE.
    int Write(size_t index, std::string_view text);

    // All files of the family must have been written. 0, ERR_WRITE_FAILED or ERR_NOT_ENOUGH_SPACE with nothing moved, or
    // with a single file moved that may not outlive a power failure; ERR_RENAME_FAILED with nothing moved, or with the
    // rest left to FinishCommit.
    int Commit();

  private:
    int CommitOne();
    int CommitAll();

    const StoreFamily &family_;
    std::vector<TextRow> changed_;
    bool keep_ = false;
};

// Completes a commit that a dead process left half done. 0, or ERR_RENAME_FAILED when that is still not possible.
int FinishCommit(const StoreFamily &family);

// Removes the temporary files, unless a commit is to be completed with them. 0 or ERR_REMOVE_FAILED.
int RemoveTemporaries(const StoreFamily &family);

}  // namespace tavo

#endif
