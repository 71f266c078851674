// What a change of users or groups means for the files of other programs and, when users change, for the group file.
#ifndef TAVO_ACCOUNT_DETAIL_NEIGHBOUR_CHANGES_H
#define TAVO_ACCOUNT_DETAIL_NEIGHBOUR_CHANGES_H

#include "account/detail/account_commit.h"
#include "account/detail/account_session.h"
#include "account/detail/neighbour_files.h"
#include "core/detail/result.h"
#include "core/detail/where.h"

#include <memory>
#include <vector>

namespace tavo {

class NeighbourChanges {
  public:
    // Names and files are those of `commit`, which must live longer. Failures are logged at `where`.
    NeighbourChanges(AccountCommit &commit, Where where) : commit_(commit), where_(where) {}
    NeighbourChanges(const NeighbourChanges &) = delete;
    NeighbourChanges &operator=(const NeighbourChanges &) = delete;

    // The credentials of the network backup service, with new passwords: those are in no step.
    NetBackupUsers &Backup()
    {
        backup_is_set_ = true;
        return backup_;
    }

    // Composes the files for the steps of the commit. What cannot be composed is logged and pending.
    void Compose();

    // To be called around a commit: it logs the targets whose files could not be moved, and seals the stores of groups.
    unsigned Pending() const;
    void AfterCommit(unsigned pending_before);

    // Nothing of it could be committed: all names are pending.
    void GiveUp();

    // Ready for other steps.
    void Clear();

  private:
    void ComposeOne(unsigned target);
    Code ComposeTarget(unsigned target, const std::vector<NameStep> &steps);
    Code ComposeMembers(const std::vector<NameStep> &steps);

    AccountCommit &commit_;
    const Where where_;
    NetBackupUsers backup_;
    bool backup_is_set_ = false;
    std::unique_ptr<AccountSession> groups_;  // when a change of users touches groups
};

}  // namespace tavo

#endif
