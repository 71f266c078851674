// The home folders of users that are added, renamed and deleted.
#include "account/detail/user_homes.h"

#include "tavo_section.h"

#include "account/detail/account_name.h"
#include "core/detail/appliance_paths.h"
#include "core/detail/keep_fault.h"
#include "core/detail/list_owner.h"
#include "core/detail/open_file.h"
#include "core/detail/run_command.h"
#include "core/detail/setting_switch.h"
#include "core/detail/shell_command.h"

#include <algorithm>
#include <charconv>
#include <filesystem>

#include <sys/file.h>

namespace tavo {
namespace {

constexpr mode_t kHomeMode = 0755;

// A folder's name, never a path: accounts of other systems may be called anything.
bool IsFolderName(const std::string &name)
{
    return !name.empty() && name.find('/') == name.npos && !IsDotName(name);
}

Fd OpenDirectory(const char *path)
{
    return OpenFd(path, O_RDONLY | O_DIRECTORY);
}

// 0 with errno when there is no such folder.
uint64_t InodeOf(const Fd &folder, const std::string &name)
{
    if (folder)
        errno = ENOENT;
    struct stat st;
    return folder && IsFolderName(name) && ::fstatat(folder.Get(), name.c_str(), &st, AT_SYMLINK_NOFOLLOW) == 0
               ? uint64_t{st.st_ino}
               : 0;
}

// Where the share "homes" is; empty, when there is none. errno is ENOENT then, unless the settings cannot be read.
std::string PathOfHomes()
{
    const KeepFault keep;
    HashOwner pairs(PshTLIBSzHashAlloc(1024));
    if (!pairs)
        throw std::bad_alloc();
    tavoerrno = 0;
    errno = ENOENT;
    if (TLIBFileGetSection(kShareFile, "homes", pairs.Addr()) < 0) {
        if (tavoerrno == ERR_OUT_OF_MEMORY)
            throw std::bad_alloc();
        if (tavoerrno == ERR_SECTION_NOT_FOUND)
            errno = ENOENT;
        return {};
    }
    errno = ENOENT;
    const char *path = SzTLIBSzHashGetValue(pairs.Get(), "path");
    return path ? path : "";
}

// "/volume3/homes" is on "/volume3"; empty for a path of another form.
std::string VolumeOf(std::string_view path)
{
    constexpr std::string_view begin = "/volume";
    unsigned number = 0;
    const char *digits = path.data() + begin.size();
    if (!path.starts_with(begin))
        return {};
    const auto [end, error] = std::from_chars(digits, path.data() + path.size(), number);
    if (error != std::errc() || end == path.data() + path.size() || *end != '/')
        return {};
    return std::string(begin) + std::to_string(number);
}

HomeResult MakeHome(const HomeStep &step)
{
    const Fd homes = OpenDirectory(kHomes);
    if (!homes || !IsFolderName(step.name))
        return HomeResult::failed;
    const bool made = ::mkdirat(homes.Get(), step.name.c_str(), kHomeMode) == 0;
    if (!made && errno != EEXIST)
        return HomeResult::failed;
    const Fd home(::openat(homes.Get(), step.name.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    return home && (!made || ::fchmod(home.Get(), kHomeMode) == 0) &&
                   ::fchown(home.Get(), static_cast<uid_t>(step.uid), static_cast<gid_t>(step.gid)) == 0
               ? HomeResult::done
               : HomeResult::failed;
}

// Checks whether the folder of a step still has to be moved. Returns done when it does not exist any more.
std::optional<HomeResult> WithoutFolder(const Fd &homes, const HomeStep &step)
{
    const uint64_t inode = InodeOf(homes, step.name);
    if (inode == step.inode)
        return std::nullopt;
    return inode != 0 || errno == ENOENT || errno == ENOTDIR ? HomeResult::done : HomeResult::failed;
}

HomeResult MoveHome(const HomeStep &step)
{
    const Fd homes = OpenDirectory(kHomes);
    if (const std::optional<HomeResult> result = WithoutFolder(homes, step))
        return *result;
    // Never into or over a folder that is there already.
    if (IsFolderName(step.new_name) &&
        ::renameat2(homes.Get(), step.name.c_str(), homes.Get(), step.new_name.c_str(), RENAME_NOREPLACE) == 0)
        return HomeResult::done;
    return errno == EXDEV ? HomeResult::elsewhere : HomeResult::failed;
}

// The staging folder, made when it is not there. Ours, not a link that leads elsewhere.
Fd OpenStage(const std::string &path)
{
    const std::string scratch = std::filesystem::path(path).parent_path();
    if ((::mkdir(scratch.c_str(), 0777) != 0 && errno != EEXIST) ||
        (::mkdir(path.c_str(), 0777) != 0 && errno != EEXIST))
        return Fd();
    Fd stage(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    struct stat st;
    return stage && ::fstat(stage.Get(), &st) == 0 && st.st_uid == ::geteuid() ? std::move(stage) : Fd();
}

const std::string *StageOn(const std::string &volume, const std::vector<std::string> &stages)
{
    for (auto stage = stages.rbegin(); stage != stages.rend(); ++stage)
        if (stage->starts_with(volume + '/'))
            return &*stage;
    return nullptr;
}

HomeResult StageHome(const HomeStep &step, const std::vector<std::string> &stages)
{
    const std::string path = PathOfHomes();
    const Fd homes = path.empty() ? Fd() : OpenDirectory(path.c_str());
    if (const std::optional<HomeResult> result = WithoutFolder(homes, step))
        return *result;
    const std::string *stage = StageOn(VolumeOf(path), stages);
    const Fd aside = stage ? OpenStage(*stage) : Fd();
    if (!aside)
        return HomeResult::failed;
    if (::renameat(homes.Get(), step.name.c_str(), aside.Get(), step.name.c_str()) == 0)
        return HomeResult::done;
    return errno == EXDEV ? HomeResult::elsewhere : HomeResult::failed;
}

bool MoveByCommand(const std::string &from, const std::string &to)
{
    const std::optional<std::string> command = ShellCommand("/bin/mv %s %s > /dev/null 2>&1", from, to);
    return command && RunCommand(*command) == 0;
}

}  // namespace

HomePlan PlanHomes(std::span<const DoneUser> done, Marker &marker)
{
    HomePlan plan;
    const std::optional<bool> enabled = ReadSetting(kSettings, "userHomeEnable", "yes");
    if (!enabled)
        plan.Unknown("");
    if (!enabled.value_or(false))
        return plan;
    const Fd homes = OpenDirectory(kHomes);
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
    const std::string volume = VolumeOf(path);
    const Fd homes = volume.empty() ? Fd() : OpenDirectory(path.c_str());
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

HomeResult TakeHomeStep(const HomeStep &step, const std::vector<std::string> &stages)
{
    switch (step.kind) {
    case HomeStep::kMake:
        return MakeHome(step);
    case HomeStep::kMove:
        return MoveHome(step);
    default:
        return StageHome(step, stages);
    }
}

bool MoveHomeElsewhere(const HomeStep &step, const std::vector<std::string> &stages)
{
    if (step.kind == HomeStep::kMove)
        return MoveByCommand(kHomes + step.name, kHomes + step.new_name);
    const std::string path = PathOfHomes();
    const std::string *stage = StageOn(VolumeOf(path), stages);
    return stage && MoveByCommand(path + '/' + step.name, *stage);
}

bool RemoveStage(const std::string &path, bool &theirs)
{
    const Fd stage(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    theirs = false;
    if (!stage)
        return errno == ENOENT;
    if (::flock(stage.Get(), LOCK_EX | LOCK_NB) != 0) {
        theirs = true;
        return true;
    }
    std::error_code error;
    std::filesystem::remove_all(path, error);  // removes links, never what they lead to
    return !error;
}

}  // namespace tavo
