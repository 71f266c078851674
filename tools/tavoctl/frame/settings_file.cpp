// The settings file that a verb of conf or section addresses.
#include "frame/settings_file.h"

#include "frame/containers.h"
#include "frame/host.h"
#include "frame/private_copy.h"
#include "frame/terminal_text.h"

#include "tavo_file.h"
#include "tavo_lock.h"
#include "tavo_str.h"

#include <cerrno>
#include <filesystem>
#include <iostream>

#include <unistd.h>

namespace tavoctl {
namespace {

bool IsMissing(const std::string &path)
{
    return ::access(path.c_str(), F_OK) != 0 && errno == ENOENT;
}

// The system settings have a lock; the programs of the appliance agree on none for other files of this kind.
bool IsSystemSettings(const std::string &path)
{
    namespace fs = std::filesystem;
    std::error_code error;
    if (fs::equivalent(path, settings_file, error))
        return true;
    return fs::absolute(path, error).lexically_normal() == settings_file;
}

void ShowDryRun(const std::string &path, const std::function<void(const char *)> &edit)
{
    const PrivateCopy copy(path);
    edit(copy.Path().c_str());
    const std::string diff = copy.Difference();
    std::cout << (::isatty(STDOUT_FILENO) ? Printable(diff, true) : diff);
}

}  // namespace

void SettingsFile::DeclareSystem(Arguments &arguments, bool changes)
{
    arguments.Option("--file", "PATH", path_, std::string("the file (") + settings_file + ")");
    arguments.Flag("--defaults", defaults_, std::string("the factory settings, ") + defaults_file);
    if (changes)
        arguments.Number("--timeout", "SECONDS", wait_, "how long to wait for the lock of the system settings (5)");
}

void SettingsFile::DeclareAny(Arguments &arguments, bool changes)
{
    must_be_named_ = true;
    arguments.Option("--file", "PATH", path_, "the file; required");
    if (changes)
        arguments.Number("--timeout", "SECONDS", wait_,
                         std::string("how long to wait for the lock if it is ") + settings_file + " (5)");
}

const std::string &SettingsFile::Path()
{
    if (defaults_ && !path_.empty())
        throw UsageFailure("choose a file", "--file and --defaults name two");
    if (path_.empty() && must_be_named_)
        throw UsageFailure("choose a file", "--file PATH is required");
    if (path_.empty())
        path_ = defaults_ ? defaults_file : settings_file;
    return path_;
}

void SettingsFile::Change(const Call &call, const std::function<void(const char *)> &edit)
{
    const std::string &path = Path();
    if (call.dry_run)
        return ShowDryRun(path, edit);
    std::optional<HeldLocks> lock;
    if (IsSystemSettings(path))
        lock.emplace(TAVO_LOCK_TAVOINFO, false, wait_);
    edit(path.c_str());
}

Failure SettingsFile::Failed(const std::string &attempted)
{
    Failure failure = LibraryFailure(attempted);
    if (failure.code == ERR_OPEN_FAILED && IsMissing(Path())) {
        failure.reason = "there is no such file";
        failure.hint = "check the path";
        failure.status = exit_not_found;
    }
    return failure;
}

std::vector<std::string> SettingsFile::Lines()
{
    StringList lines;
    if (TLIBFileReadLines(Path().c_str(), lines.Address()) < 0)
        throw Failed("read " + Path());
    return lines.Items();
}

std::optional<std::pair<std::string, std::string>> SplitSetting(std::string line)
{
    if (line.starts_with('#') || line.starts_with(';') || line.find('=') == std::string::npos)
        return {};
    char *cursor = line.data();
    char *key = TLIBStrTok(&cursor, "=");
    if (!key || TLIBStrTrimSpace(key, nullptr) <= 0)
        return {};
    std::string value = cursor ? cursor : "";
    TLIBStrTrimSpace(value.data(), nullptr);
    return std::pair<std::string, std::string>(key, value.c_str());
}

std::pair<std::string, std::string> PairArgument(const std::string &argument)
{
    const std::size_t sign = argument.find('=');
    if (sign == std::string::npos || sign == 0)
        throw UsageFailure("set " + argument, "it is not of the form KEY=VALUE");
    return {argument.substr(0, sign), argument.substr(sign + 1)};
}

}  // namespace tavoctl
