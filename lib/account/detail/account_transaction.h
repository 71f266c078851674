// One change of users or groups with all its consequences: the locks, the stores, the text files, the files of
// neighbours, the home folders. It first completes the steps of a change whose process died.
#ifndef TAVO_ACCOUNT_DETAIL_ACCOUNT_TRANSACTION_H
#define TAVO_ACCOUNT_DETAIL_ACCOUNT_TRANSACTION_H

#include "account/detail/account_commit.h"
#include "account/detail/account_session.h"
#include "account/detail/follow_up_log.h"
#include "account/detail/neighbour_files.h"
#include "account/detail/user_homes.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace tavo {

class AccountTransaction {
  public:
    // Failures of the following steps, including those of earlier changes, are logged at `where`.
    explicit AccountTransaction(const AccountKind &kind, Where where = Where())
        : kind_(kind), where_(where), session_(kind)
    {
    }
    AccountTransaction(const AccountTransaction &) = delete;
    AccountTransaction &operator=(const AccountTransaction &) = delete;

    // Takes the locks, all three of the accounts when something is left to do, does it, and opens the stores. The codes
    // of AccountSession::OpenToChange and ResumeCommit.
    int Begin(unsigned locks);

    AccountSession &Session() { return session_; }

    // Returns whether rights of an earlier account of this name still have to be removed: a new account of the name
    // would have them.
    bool IsPending(bool is_group, const std::string &key) const;

    // The planned steps of the change. `targets` of a step: the files that contain the name.
    AccountCommit &Files() { return commit_; }
    NetBackupUsers &Backup()
    {
        backup_is_set_ = true;
        return backup_;
    }

    // Composes the neighbours' files for the steps in Files(). Files that cannot be composed are pending.
    void Compose();

    // Composes the account files by `compose` from stores into which everything is merged that others have changed in
    // the files meanwhile. Its code; after some rounds ERR_RENAME_FAILED.
    int ComposeAccounts(const std::function<int()> &compose);

    // Everything at once, then the home folders. A code of AccountCommit::Commit. From 0 on nothing fails any more.
    int Commit();

    // Releases the locks, then does the slow steps: removes and copies folders. Returns false when a lock could not be
    // released.
    bool End();

  private:
    void FinishEarlier();
    int ComposeMembers(const std::vector<NameStep> &steps);
    void ComposeOne(unsigned target);
    void SealGroups();
    void TakeHomeSteps();
    void DoWhatTakesTime();
    void ForgetDone(const std::vector<std::string> &stages, const std::vector<HomeStep> &moved);

    const AccountKind &kind_;
    const Where where_;
    AccountSession session_;
    AccountCommit commit_;
    NetBackupUsers backup_;
    bool backup_is_set_ = false;              // with passwords, which no step has
    std::unique_ptr<AccountSession> groups_;  // when a change of users touches groups
    std::vector<HomeStep> elsewhere_;
};

}  // namespace tavo

#endif
