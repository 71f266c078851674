// One change of users or groups with all its consequences: the locks, the stores, the text files, the files of
// neighbours, the home folders. It first completes the steps of a change whose process died.
#ifndef TAVO_ACCOUNT_DETAIL_ACCOUNT_TRANSACTION_H
#define TAVO_ACCOUNT_DETAIL_ACCOUNT_TRANSACTION_H

#include "account/detail/account_commit.h"
#include "account/detail/account_session.h"
#include "account/detail/home_changes.h"
#include "account/detail/neighbour_changes.h"
#include "core/detail/result.h"

#include <functional>
#include <string>

namespace tavo {

class AccountTransaction {
  public:
    // Failures of the following steps, including those of earlier changes, are logged at `where`.
    explicit AccountTransaction(const AccountKind &kind, Where where = Where())
        : session_(kind), neighbours_(commit_, where), homes_(commit_, kind, where)
    {
    }
    AccountTransaction(const AccountTransaction &) = delete;
    AccountTransaction &operator=(const AccountTransaction &) = delete;

    // Takes the locks, all three of the accounts when something is left to do, does it, and opens the stores. The codes
    // of AccountSession::OpenToChange and ResumeCommit.
    Code Begin(unsigned locks);

    AccountSession &Session() { return session_; }

    // Returns whether rights of an earlier account of this name still have to be removed: a new account of the name
    // would have them.
    bool IsPending(bool is_group, const std::string &key) const;

    // The planned steps of the change. `targets` of a step: the files that contain the name.
    AccountCommit &Files() { return commit_; }
    NetBackupUsers &Backup() { return neighbours_.Backup(); }

    // Composes the neighbours' files for the steps in Files(). Files that cannot be composed are pending.
    void Compose() { neighbours_.Compose(); }

    // Composes the account files by `compose` from stores into which everything is merged that others have changed in
    // the files meanwhile. Its code; after some rounds ERR_RENAME_FAILED.
    Code ComposeAccounts(const std::function<Code()> &compose);

    // Everything at once, then the home folders. A code of AccountCommit::Commit. From 0 on nothing fails any more.
    Code Commit();

    // Releases the locks; then, after a commit, flushes the caches of the system's look-ups, and removes and copies folders.
    // Returns false when a lock could not be released.
    bool End();

  private:
    void FinishEarlier();

    AccountSession session_;
    AccountCommit commit_;
    NeighbourChanges neighbours_;
    HomeChanges homes_;
    bool committed_ = false;
};

}  // namespace tavo

#endif
