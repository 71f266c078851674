// One change of users or groups with everything that follows from it.
#include "account/detail/account_transaction.h"

#include "account/detail/account_name.h"
#include "account/detail/commit_resume.h"
#include "account/detail/name_caches.h"
#include "account/detail/neighbour_files.h"
#include "core/detail/log.h"

#include <algorithm>

#include <unistd.h>

namespace tavo {

Code AccountTransaction::Begin(unsigned locks)
{
    for (;;) {
        // Everybody's files may have to be finished, and a lock that comes earlier cannot be taken later.
        const unsigned wanted = MarkerStands() ? locks | kAccountLocks : locks;
        if (const Code code = session_.LockToChange(wanted))
            return code;
        if (wanted == (locks | kAccountLocks) || !MarkerStands())
            break;
        session_.Unlock();  // a process died meanwhile
    }
    Marker earlier;
    if (MarkerStands()) {
        if (const Code code = ResumeCommit(earlier))
            return code;
    }
    // Temporary files of a process that died before its change was decided: they hold hashes.
    for (const StoreFamily *family : {&kUserFamily, &kGroupFamily})
        for (const TextRow &row : family->texts)
            ::unlink(row.temporary);
    RemoveNeighbourTemporaries();
    if (!earlier.IsEmpty()) {
        commit_.Steps() = std::move(earlier);
        FinishEarlier();
    }
    return session_.OpenAll();
}

// Steps that fail again stay listed, and so in the next marker.
void AccountTransaction::FinishEarlier()
{
    Marker &steps = commit_.Steps();
    for (NameStep &step : steps.names) {
        step.targets = step.pending;
        step.pending = 0;
    }
    Compose();
    const unsigned pending = neighbours_.Pending();
    if (commit_.Commit() == 0)
        neighbours_.AfterCommit(pending);
    else
        neighbours_.GiveUp();
    homes_.TakeSteps();
    commit_.Settle();
    neighbours_.Clear();
}

bool AccountTransaction::IsPending(bool is_group, const std::string &key) const
{
    const size_t key_size = is_group ? kGroupKeySize : kUserKeySize;
    const Marker &steps = commit_.Steps();
    return std::any_of(steps.names.begin(), steps.names.end(),
                       [&](const NameStep &step) {
                           return step.is_group == is_group && (step.pending & ~kGuestModule) != 0 &&
                                  AccountKey(step.old_name, key_size) == key;
                       }) ||
           (!is_group && std::any_of(steps.homes.begin(), steps.homes.end(), [&](const HomeStep &step) {
               return step.kind != HomeStep::kMake && AccountKey(step.name) == key;
           }));
}

Code AccountTransaction::ComposeAccounts(const std::function<Code()> &compose)
{
    constexpr int rounds = 5;
    for (int round = 0; round < rounds; ++round) {
        Code code = session_.Merge();
        if (code == 0)
            code = compose();
        if (code != 0 || session_.IsMerged())
            return code;
        commit_.Withdraw(kAccountFile);
    }
    return ERR_RENAME_FAILED;
}

Code AccountTransaction::Commit()
{
    const unsigned pending = neighbours_.Pending();
    if (const Code code = commit_.Commit())
        return code;
    committed_ = true;
    // The change has happened. Steps that fail from here on, also for lack of memory, are left to the next change.
    if (!commit_.IsSynced())
        LogError("%s:%d Failed to sync the folders of the account files, errno=%d", errno);
    try {
        neighbours_.AfterCommit(pending);
        if (session_.SealWritten() != 0)
            LogError("%s:%d Failed to close the account stores, errno=%d", errno);
        commit_.Samba().Release();
        homes_.TakeSteps();
    } catch (const std::bad_alloc &) {
        LogError("%s:%d Out of memory, what follows the change is left to the next one");
        return 0;  // the marker says all of it
    }
    commit_.Settle();
    return 0;
}

bool AccountTransaction::End()
{
    const bool unlocked = session_.Unlock();
    if (committed_)
        FlushNameCaches();
    try {
        homes_.Finish();
    } catch (const std::bad_alloc &) {
        LogError("%s:%d Out of memory, folders are left to the next change");
    }
    return unlocked;
}

}  // namespace tavo
