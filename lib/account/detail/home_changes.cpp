// The home folders of a change.
#include "account/detail/home_changes.h"

#include "account/detail/follow_up_log.h"
#include "core/detail/keep_fault.h"

#include <algorithm>

namespace tavo {

void HomeChanges::TakeSteps()
{
    const KeepErrno keep_errno;
    std::vector<HomeStep> &homes = commit_.Steps().homes;
    const std::vector<std::string> &stages = commit_.Steps().stages;
    std::erase_if(homes, [&](const HomeStep &step) {
        errno = 0;
        const HomeResult result = TakeHomeStep(step, stages);
        const int reason = errno;
        if (result == HomeResult::elsewhere)
            elsewhere_.push_back(step);
        if (result == HomeResult::failed)
            LogFollowUp({.home = &step, .code = reason}, where_);
        // Without a folder for homes, or when the new name is taken, trying again would be useless.
        return result == HomeResult::done || (result == HomeResult::failed && (reason == ENOENT || reason == EEXIST));
    });
}

void HomeChanges::Finish()
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
void HomeChanges::ForgetDone(const std::vector<std::string> &stages, const std::vector<HomeStep> &moved)
{
    const KeepFault keep;
    AccountSession locks(kind_);
    Marker marker;
    if ((stages.empty() && moved.empty()) || locks.LockToChange(kAccountLocks) != 0 || ReadMarker(marker) != 0 ||
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
