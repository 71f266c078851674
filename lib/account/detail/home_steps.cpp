// Takes the steps of a change that are about home folders.
#include "account/detail/home_steps.h"

#include "account/detail/home_folders.h"
#include "account/detail/user_accounts.h"
#include "core/detail/run_command.h"
#include "core/detail/shell_command.h"
#include "core/detail/volume_path.h"

#include <filesystem>
#include <optional>

#include <sys/file.h>

namespace tavo {
namespace {

constexpr mode_t kHomeMode = 0755;

HomeResult MakeHome(const HomeStep &step)
{
    const Fd homes = OpenFolder(kHomes);
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
    const Fd homes = OpenFolder(kHomes);
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

const std::string *StageOn(std::string_view volume, const std::vector<std::string> &stages)
{
    for (auto stage = stages.rbegin(); stage != stages.rend(); ++stage)
        if (stage->starts_with(std::string(volume) + '/'))
            return &*stage;
    return nullptr;
}

HomeResult StageHome(const HomeStep &step, const std::vector<std::string> &stages)
{
    const std::string path = PathOfHomes();
    const Fd homes = path.empty() ? Fd() : OpenFolder(path.c_str());
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
