// What a change of users or groups means for the files of other programs.
#include "account/detail/neighbour_changes.h"

#include "tavo_lock.h"

#include "account/detail/follow_up_log.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_dump.h"
#include "account/detail/group_members.h"
#include "account/detail/group_texts.h"
#include "core/detail/keep_fault.h"

#include <algorithm>
#include <iterator>

namespace tavo {
namespace {

constexpr unsigned kTargets[] = {kSambaLists, kShareLists, kMemberLists, kFtpList, kBackupUsers, kGuestModule};

}  // namespace

void NeighbourChanges::Compose()
{
    for (const unsigned target : kTargets)
        ComposeOne(target);
}

void NeighbourChanges::ComposeOne(unsigned target)
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
    if (!waits)
        failure.code = ComposeTarget(target, steps);
    if (failure.code == 0)
        return;
    // A service that is not installed needs no change.
    if (target != kGuestModule || failure.code != ERR_FILE_NOT_FOUND)
        for (NameStep &step : names)
            step.pending |= step.targets & target;
    LogFollowUp(failure, where_);
}

Code NeighbourChanges::ComposeTarget(unsigned target, const std::vector<NameStep> &steps)
{
    const KeepFault keep;
    if (target == kMemberLists)
        return ComposeMembers(steps);
    if (target == kBackupUsers && backup_is_set_)
        return ComposeBackup(backup_, commit_);
    return ComposeNeighbour(target, steps, backup_, commit_);
}

Code NeighbourChanges::ComposeMembers(const std::vector<NameStep> &steps)
{
    NameMap map;
    for (const NameStep &step : steps)
        map.Add(step);
    auto groups = std::make_unique<AccountSession>(kGroupKind);
    bool changed = false;
    Code code = groups->OpenToChange(TAVO_LOCK_GROUP);
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

unsigned NeighbourChanges::Pending() const
{
    unsigned pending = 0;
    for (const NameStep &step : commit_.Steps().names)
        pending |= step.pending;
    return pending;
}

void NeighbourChanges::AfterCommit(unsigned pending_before)
{
    const unsigned pending = Pending();
    // A group file that could not be moved leaves the stores without a seal, and the next call rebuilds them.
    if (groups_ && (pending & kMemberLists) == 0)
        (void)groups_->SealWritten();
    groups_.reset();
    for (const unsigned target : kTargets)
        if ((pending & ~pending_before & target) != 0)
            LogFollowUp({.target = target, .code = ERR_RENAME_FAILED}, where_);
}

void NeighbourChanges::GiveUp()
{
    for (const unsigned target : kTargets)
        commit_.Withdraw(target);
    for (NameStep &step : commit_.Steps().names)
        step.pending = step.targets;
}

void NeighbourChanges::Clear()
{
    groups_.reset();
    backup_ = {};
    backup_is_set_ = false;
}

}  // namespace tavo
