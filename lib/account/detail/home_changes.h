// The home folders of a change: one rename each under the locks, and what takes its time after them.
#ifndef TAVO_ACCOUNT_DETAIL_HOME_CHANGES_H
#define TAVO_ACCOUNT_DETAIL_HOME_CHANGES_H

#include "account/detail/account_commit.h"
#include "account/detail/account_session.h"
#include "account/detail/home_plan.h"
#include "account/detail/home_steps.h"
#include "core/detail/where.h"

#include <vector>

namespace tavo {

class HomeChanges {
  public:
    // The steps are those of `commit`, which must live longer. Failures are logged at `where`.
    HomeChanges(AccountCommit &commit, const AccountKind &kind, Where where)
        : commit_(commit), kind_(kind), where_(where)
    {
    }
    HomeChanges(const HomeChanges &) = delete;
    HomeChanges &operator=(const HomeChanges &) = delete;

    // Under the locks. Steps that succeed leave the commit; those that fail are logged and stay.
    void TakeSteps();

    // After the locks: moves folders from other file systems, removes those of deleted users, and takes both from the
    // marker. Throws bad_alloc, and then the next change does it.
    void Finish();

  private:
    void ForgetDone(const std::vector<std::string> &stages, const std::vector<HomeStep> &moved);

    AccountCommit &commit_;
    const AccountKind &kind_;
    const Where where_;
    std::vector<HomeStep> elsewhere_;
};

}  // namespace tavo

#endif
