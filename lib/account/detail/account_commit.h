// Replaces all files of one change together: the text files of users and groups, and the neighbours' files that contain
// the names. Each new file is written and synced beside the old one. Then the marker, which lists the files and the
// following steps, is made durable, the files are moved into place one by one, and the marker is removed. If the
// process dies before the marker, the old files stay; if it dies later, the next caller completes the change.
// Unchanged files are not rewritten. If only one file changes, its rename alone is atomic and needs no marker.
#ifndef TAVO_ACCOUNT_DETAIL_ACCOUNT_COMMIT_H
#define TAVO_ACCOUNT_DETAIL_ACCOUNT_COMMIT_H

#include "account/detail/commit_marker.h"
#include "account/detail/samba_lock.h"
#include "account/detail/store_family.h"
#include "core/detail/file_rewrite.h"
#include "core/detail/owner.h"
#include "core/detail/result.h"

#include <string_view>

namespace tavo {

class AccountCommit {
  public:
    // `carried`: remaining steps of an earlier change, from ResumeCommit.
    explicit AccountCommit(Marker carried = {}) : marker_(std::move(carried)) {}
    ~AccountCommit();  // removes files that were not committed
    AccountCommit(const AccountCommit &) = delete;
    AccountCommit &operator=(const AccountCommit &) = delete;

    // Writes the next generation of an account file, with the owner and mode of the old one. A `target` makes it a
    // neighbour's file: the group file when users change. 0, ERR_OPEN_FAILED, ERR_WRITE_FAILED or ERR_NOT_ENOUGH_SPACE.
    Code Write(const TextRow &row, std::string_view text, unsigned target = kAccountFile);

    // The same for a neighbour's file that `file` has opened and read. A failure leaves that file out of the commit.
    Code WriteNeighbour(unsigned target, FileRewrite &file, std::string_view text, mode_t mode_of_new);

    // Leaves out the files of a target after all.
    void Withdraw(unsigned target) noexcept;

    // Samba's lock on its password file: to be taken before that is compared and written, and released when the stamps
    // of the new one are recorded.
    SambaLock &Samba() { return samba_; }

    // The following steps, for the marker.
    Marker &Steps() { return marker_; }
    const Marker &Steps() const { return marker_; }

    // All files must have been written. 0; ERR_WRITE_FAILED or ERR_NOT_ENOUGH_SPACE with nothing moved;
    // ERR_RENAME_FAILED with nothing moved, or with the rest left to ResumeCommit. Neighbours' files that could not be
    // moved are pending in the steps.
    Code Commit();

    // Returns whether the last Commit also made its renames durable. They have taken place even if not.
    bool IsSynced() const { return synced_; }

    // To be called when the steps have been taken, as far as they could be: `steps` is what is left. Never fails: a
    // marker that could not be replaced says to do again what was done, and that does nothing.
    void Settle() noexcept;

  private:
    Fd Begin(FileStep step, bool makes_folder);  // the temporary file of a step, which joins the list
    void Complete();                             // the last one is written
    Code CommitOne();
    Code CommitAll();
    bool MoveAll(bool &moved);

    Marker marker_;
    SambaLock samba_;
    bool synced_ = true;
    bool decided_ = false;  // the temporary files belong to the marker
};

}  // namespace tavo

#endif
