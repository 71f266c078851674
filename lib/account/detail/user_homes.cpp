// The home folders of users that are added, renamed and deleted.
#include "account/detail/account_name.h"
#include "account/detail/user_follow_up.h"
#include "core/detail/keep_fault.h"
#include "core/detail/list_owner.h"
#include "core/detail/open_file.h"
#include "core/detail/run_command.h"
#include "core/detail/shell_command.h"
#include "tavo_section.h"

#include <charconv>
#include <filesystem>

namespace tavo {
namespace {

constexpr char kShares[] = "/usr/tavo/etc/share.conf";
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

// Where the share "homes" lies; empty when there is none.
std::string PathOfHomes()
{
    const KeepFault keep;
    HashOwner pairs(PshTLIBSzHashAlloc(1024));
    if (!pairs || TLIBFileGetSection(kShares, "homes", pairs.Addr()) < 0)
        return {};
    const char *path = SzTLIBSzHashGetValue(pairs.Get(), "path");
    return path ? path : "";
}

// "/volume3/homes" lies on "/volume3"; empty for a path of another form.
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

bool MoveByCommand(const std::string &from, const std::string &to)
{
    const std::optional<std::string> command = ShellCommand("/bin/mv %s %s > /dev/null 2>&1", from, to);
    return command && RunCommand(*command) == 0;
}

}  // namespace

bool CreateHome(const DoneUser &user)
{
    const Fd homes = OpenDirectory(kHomes);
    if (!homes || !IsFolderName(user.name))
        return false;
    const bool made = ::mkdirat(homes.Get(), user.name.c_str(), kHomeMode) == 0;
    if (!made && errno != EEXIST)
        return false;
    const Fd home(::openat(homes.Get(), user.name.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    return home && (!made || ::fchmod(home.Get(), kHomeMode) == 0) &&
           ::fchown(home.Get(), static_cast<uid_t>(user.uid), static_cast<gid_t>(user.gid)) == 0;
}

bool MoveHome(const std::string &old_name, const std::string &new_name)
{
    const Fd homes = OpenDirectory(kHomes);
    if (!homes || !IsFolderName(old_name) || !IsFolderName(new_name))
        return false;
    // Never into or over a folder that is there already.
    if (::renameat2(homes.Get(), old_name.c_str(), homes.Get(), new_name.c_str(), RENAME_NOREPLACE) == 0)
        return true;
    return errno == EXDEV && MoveByCommand(kHomes + old_name, kHomes + new_name);
}

bool RemoveHomes(std::span<const std::string> names)
{
    const std::string homes_path = PathOfHomes();
    const std::string volume = VolumeOf(homes_path);
    const Fd homes = volume.empty() ? Fd() : OpenDirectory(homes_path.c_str());
    if (!homes)
        return true;
    const std::string scratch = volume + "/@tmp";
    const std::string staging = scratch + "/@del_users_home_" + std::to_string(::getpid());
    if ((::mkdir(scratch.c_str(), 0777) != 0 && errno != EEXIST) || ::mkdir(staging.c_str(), 0777) != 0)
        return false;
    const Fd aside(::open(staging.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    bool moved = static_cast<bool>(aside);
    for (const std::string &name : names) {
        if (!aside || !IsFolderName(name) || ::renameat(homes.Get(), name.c_str(), aside.Get(), name.c_str()) == 0 ||
            errno == ENOENT)
            continue;
        moved = MoveByCommand(homes_path + '/' + name, staging) && moved;
    }
    std::error_code error;
    std::filesystem::remove_all(staging, error);  // removes links, never what they lead to
    return moved && !error;
}

}  // namespace tavo
