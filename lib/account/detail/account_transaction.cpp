// One change of users or groups with everything that follows from it.
#include "account/detail/account_transaction.h"

#include "account/detail/account_name.h"
#include "account/detail/commit_resume.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_dump.h"
#include "account/detail/group_members.h"
#include "account/detail/group_texts.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "tavo_lock.h"

#include <algorithm>

namespace tavo {
namespace {

constexpr unsigned kAllLocks = TAVO_LOCK_USER | TAVO_LOCK_GROUP | TAVO_LOCK_SMB;
constexpr unsigned kTargets[] = {kSambaLists, kShareLists, kMemberLists, kFtpList, kBackupUsers, kGuestModule};

}  // namespace

int AccountTransaction::Begin(unsigned locks)
{
    for (;;) {
        // Everybody's files may have to be finished, and a lock that comes earlier cannot be taken later.
        const unsigned wanted = MarkerStands() ? locks | kAllLocks : locks;
        if (const int code = session_.LockToChange(wanted))
            return code;
        if (wanted == (locks | kAllLocks) || !MarkerStands())
            break;
        session_.Unlock();  // a process died meanwhile
    }
    Marker earlier;
    if (MarkerStands()) {
        if (const int code = ResumeCommit(earlier))
            return code;
    }
    // Temporary files of a process that died before its change was decided: they hold hashes.
    for (const StoreFamily *family : {&kUserFamily, &kGroupFamily})
        for (const TextRow &row : family->texts)
            ::unlink(row.temporary);
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
    if (commit_.Commit() == 0) {
        SealGroups();
    } else {
        for (const unsigned target : kTargets)
            commit_.Withdraw(target);
        for (NameStep &step : steps.names)
            step.pending = step.targets;
    }
    groups_.reset();
    TakeHomeSteps();
    commit_.Settle();
    backup_ = {};
    backup_is_set_ = false;
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

void AccountTransaction::Compose()
{
    for (const unsigned target : kTargets)
        ComposeOne(target);
}

void AccountTransaction::ComposeOne(unsigned target)
{
    std::vector<NameStep> &names = commit_.Steps().names;
    const bool waits =
        std::any_of(names.begin(), names.end(), [&](const NameStep &step) { return (step.pending & target) != 0; });
    std::vector<NameStep> steps;
    std::copy_if(names.begin(), names.end(), std::back_inserter(steps),
                 [&](const NameStep &step) { return (step.targets & ~step.pending & target) != 0; });
    if (steps.empty() && !(target == kBackupUsers && backup_.IsChanged()))
        return;
    FollowUpFailure failure{.target = target, .code = ERR_OP_FAILURE};
    if (!steps.empty()) {
        failure.is_group = steps.back().is_group;
        failure.is_removal = steps.back().new_name.empty();
    }
    if (!waits) {
        const KeepFault keep;
        const bool set_already = target == kBackupUsers && backup_is_set_;
        failure.code = target == kMemberLists ? ComposeMembers(steps)
                       : set_already          ? ComposeBackup(backup_, commit_)
                                              : ComposeNeighbour(target, steps, backup_, commit_);
    }
    if (failure.code == 0)
        return;
    // A service that is not installed needs no change.
    if (target != kGuestModule || failure.code != ERR_FILE_NOT_FOUND)
        for (NameStep &step : names)
            step.pending |= step.targets & target;
    LogFollowUp(failure, where_);
}

int AccountTransaction::ComposeMembers(const std::vector<NameStep> &steps)
{
    NameMap map;
    for (const NameStep &step : steps)
        map.Add(step);
    auto groups = std::make_unique<AccountSession>(kGroupKind);
    bool changed = false;
    int code = groups->OpenToChange(TAVO_LOCK_GROUP);
    if (code == 0)
        code = groups->Merge();
    if (code == 0)
        code = ChangeMembers(
            *groups,
            [&](const std::string &member) {
                const std::string *name = map.Find(member);
                return name ? name->c_str() : nullptr;
            },
            changed);
    GroupDumpReport report;
    if (code == 0 && changed)
        code = ComposeGroups(GroupDb(*groups), commit_, kMemberLists, report);
    if (code != 0)
        commit_.Withdraw(kMemberLists);
    if (code == 0 && changed) {
        LogDroppedGroups(report, where_);
        groups_ = std::move(groups);
    }
    return code;
}

// Unless the group file could not be moved: then the stores have no seal, and are built again.
void AccountTransaction::SealGroups()
{
    const std::vector<NameStep> &names = commit_.Steps().names;
    if (!groups_ || std::any_of(names.begin(), names.end(),
                                [](const NameStep &step) { return (step.pending & kMemberLists) != 0; }))
        return;
    groups_->SealWritten();
}

int AccountTransaction::ComposeAccounts(const std::function<int()> &compose)
{
    constexpr int rounds = 5;
    for (int round = 0; round < rounds; ++round) {
        int code = session_.Merge();
        if (code == 0)
            code = compose();
        if (code != 0 || session_.IsMerged())
            return code;
        commit_.Withdraw(kAccountFile);
    }
    return ERR_RENAME_FAILED;
}

int AccountTransaction::Commit()
{
    const unsigned before = [&] {
        unsigned pending = 0;
        for (const NameStep &step : commit_.Steps().names)
            pending |= step.pending;
        return pending;
    }();
    if (const int code = commit_.Commit())
        return code;
    // The change has happened. Steps that fail from here on, also for lack of memory, are left to the next change.
    if (!commit_.IsSynced())
        LogError("%s:%d Failed to sync the folders of the account files, errno=%d", errno);
    try {
        SealGroups();
        groups_.reset();
        unsigned pending = 0;
        for (const NameStep &step : commit_.Steps().names)
            pending |= step.pending;
        for (const unsigned target : kTargets)
            if ((pending & ~before & target) != 0)
                LogFollowUp({.target = target, .code = ERR_RENAME_FAILED}, where_);
        if (session_.SealWritten() != 0)
            LogError("%s:%d Failed to close the account stores, errno=%d", errno);
        commit_.Samba().Release();
        TakeHomeSteps();
    } catch (const std::bad_alloc &) {
        LogError("%s:%d Out of memory, what follows the change is left to the next one");
        return 0;  // the marker says all of it
    }
    commit_.Settle();
    return 0;
}

void AccountTransaction::TakeHomeSteps()
{
    const KeepErrno keep_errno;
    std::vector<HomeStep> &homes = commit_.Steps().homes;
    const std::vector<std::string> &stages = commit_.Steps().stages;
    std::erase_if(homes, [&](const HomeStep &step) {
        errno = 0;
        const HomeResult result = TakeHomeStep(step, stages);
        const int reason = errno;
        if (result == HomeResult::kElsewhere)
            elsewhere_.push_back(step);
        if (result == HomeResult::kFailed)
            LogFollowUp({.home = &step, .code = reason}, where_);
        // Without a folder for homes, or when the new name is taken, trying again would be useless.
        return result == HomeResult::kDone || (result == HomeResult::kFailed && (reason == ENOENT || reason == EEXIST));
    });
}

bool AccountTransaction::End()
{
    const bool unlocked = session_.Unlock();
    try {
        DoWhatTakesTime();
    } catch (const std::bad_alloc &) {
        LogError("%s:%d Out of memory, folders are left to the next change");
    }
    return unlocked;
}

void AccountTransaction::DoWhatTakesTime()
{
    const std::vector<std::string> stages = commit_.Steps().stages;
    if (stages.empty() && elsewhere_.empty())
        return;
    std::vector<HomeStep> moved;
    for (const HomeStep &step : elsewhere_) {
        if (MoveHomeElsewhere(step, stages))
            moved.push_back(step);
        else
            LogFollowUp({.home = &step, .code = EXDEV}, where_);
    }
    std::vector<std::string> gone;
    for (const std::string &stage : stages) {
        bool theirs = false;
        if (!RemoveStage(stage, theirs))
            LogFollowUp({.code = ERR_REMOVE_FAILED}, where_);
        else if (!theirs)
            gone.push_back(stage);
    }
    ForgetDone(gone, moved);
}

// A marker that still names them says to do what is done, which takes no time.
void AccountTransaction::ForgetDone(const std::vector<std::string> &stages, const std::vector<HomeStep> &moved)
{
    const KeepFault keep;
    AccountSession locks(kind_);
    Marker marker;
    if ((stages.empty() && moved.empty()) || locks.LockToChange(kAllLocks) != 0 || ReadMarker(marker) != 0 ||
        !marker.files.empty())
        return;
    AccountCommit left(std::move(marker));
    std::vector<HomeStep> &homes = left.Steps().homes;
    std::erase_if(homes, [&](const HomeStep &step) {
        return std::any_of(moved.begin(), moved.end(), [&](const HomeStep &done) {
            return done.inode == step.inode && done.name == step.name && done.kind == step.kind;
        });
    });
    // A folder that could not be put aside needs the stage again.
    const bool is_needed =
        std::any_of(homes.begin(), homes.end(), [](const HomeStep &step) { return step.kind == HomeStep::kRemove; });
    std::erase_if(left.Steps().stages, [&](const std::string &stage) {
        return !is_needed && std::find(stages.begin(), stages.end(), stage) != stages.end();
    });
    left.Settle();
}

}  // namespace tavo
