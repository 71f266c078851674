// The home folders of users in the steps of a change.
#include "account/detail/home_plan.h"

#include "account/detail/home_folders.h"
#include "core/detail/appliance_paths.h"
#include "core/detail/setting_switch.h"
#include "core/detail/volume_path.h"

#include <algorithm>

#include <unistd.h>

namespace tavo {

HomePlan PlanHomes(std::span<const DoneUser> done, Marker &marker)
{
    HomePlan plan;
    const std::optional<bool> enabled = ReadSetting(kSettings, "userHomeEnable", "yes");
    if (!enabled)
        plan.Unknown("");
    if (!enabled.value_or(false))
        return plan;
    const Fd homes = OpenFolder(kHomes);
    for (const DoneUser &user : done) {
        if (user.IsAdded())
            marker.homes.push_back({HomeStep::kMake, user.name, {}, user.uid, user.gid, 0});
        if (!user.IsRenamed())
            continue;
        for (HomeStep &step : marker.homes)
            if (step.kind == HomeStep::kMake && step.name == user.old_name)
                step.name = user.name;  // could not be made so far
        if (const uint64_t inode = InodeOf(homes, user.old_name))
            marker.homes.push_back({HomeStep::kMove, user.old_name, user.name, -1, -1, inode});
        else
            plan.Unknown(user.old_name);
    }
    return plan;
}

HomePlan PlanRemovals(std::span<const std::string> names, Marker &marker)
{
    HomePlan plan;
    const std::string path = PathOfHomes();
    if (path.empty())
        plan.Unknown("");
    const std::string volume(VolumeOf(path));
    const Fd homes = volume.empty() ? Fd() : OpenFolder(path.c_str());
    std::erase_if(marker.homes, [&](const HomeStep &step) {
        return step.kind == HomeStep::kMake && std::find(names.begin(), names.end(), step.name) != names.end();
    });
    const size_t before = marker.homes.size();
    for (const std::string &name : names)
        if (const uint64_t inode = InodeOf(homes, name))
            marker.homes.push_back({HomeStep::kRemove, name, {}, -1, -1, inode});
        else if (!volume.empty())
            plan.Unknown(name);
    if (marker.homes.size() > before)
        marker.stages.push_back(volume + "/@tmp/@del_users_home_" + std::to_string(::getpid()));
    return plan;
}

void HomePlan::Unknown(std::string name)
{
    if (errno == ENOENT || errno == ENOTDIR)
        return;
    reason = errno;
    unknown.push_back(std::move(name));
}

}  // namespace tavo
