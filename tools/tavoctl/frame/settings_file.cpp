// The settings file that a verb of conf or section addresses.
#include "frame/settings_file.h"

#include "tavo_file.h"
#include "tavo_lock.h"
#include "tavo_str.h"

#include "frame/containers.h"
#include "frame/files.h"
#include "frame/held_locks.h"
#include "frame/host.h"
#include "frame/private_copy.h"

#include <cerrno>
#include <filesystem>

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

void RefuseUnwritable(const std::string &path)
{
    const bool there = ::eaccess(path.c_str(), F_OK) == 0;
    const std::filesystem::path folder = std::filesystem::absolute(path).parent_path();
    FailIf(::eaccess(there ? path.c_str() : folder.c_str(), W_OK) != 0 && errno == EACCES, "change " + path,
           "permission denied", "run it as root", exit_denied);
}

}  // namespace

SettingsFile SettingsFile::OfSystem(Arguments &in, unsigned trait)
{
    SettingsFile file;
    file.file_ = in.Option("--file", "PATH", file_path, std::string("the file (") + settings_file + ")");
    file.defaults_ = in.Flag("--defaults", std::string("the factory settings, ") + defaults_file);
    if (trait & changes)
        file.timeout_ = in.Number("--timeout", "SECONDS", "how long to wait for the lock of the system settings (5)");
    return file;
}

SettingsFile SettingsFile::Any(Arguments &in, unsigned trait)
{
    SettingsFile file;
    file.must_be_named_ = true;
    file.file_ = in.Option("--file", "PATH", file_path, "the file; required");
    if (trait & changes)
        file.timeout_ = in.Number("--timeout", "SECONDS",
                                  std::string("how long to wait for the lock if it is ") + settings_file + " (5)");
    return file;
}

std::string SettingsFile::Path() const
{
    RefuseIf(*defaults_ && *file_, "choose a file", "--file and --defaults name two");
    RefuseIf(!*file_ && must_be_named_, "choose a file", "--file PATH is required");
    const std::string path = file_->value_or(*defaults_ ? defaults_file : settings_file);
    RefuseNoText(path);
    return path;
}

void SettingsFile::Change(Call &call, const std::function<void(const char *)> &edit, const std::string &question) const
{
    const std::string path = Path();
    std::optional<HeldLocks> lock;
    if (!call.dry_run)
        RefuseUnwritable(path);
    if (!call.dry_run && IsSystemSettings(path))
        lock.emplace(TAVO_LOCK_TAVOINFO, false, timeout_->value_or(usual_wait));
    {
        const PrivateCopy copy(path);
        edit(copy.Path().c_str());
        call.report.diff = copy.Difference();
    }
    if (call.Proceed(question))
        edit(path.c_str());
}

Failure SettingsFile::Failed(const std::string &attempted, const std::string &hint) const
{
    Failure failure = LibraryFailure(attempted, hint);
    failure.path = Path();
    if (failure.code == ERR_OPEN_FAILED && IsMissing(Path())) {
        failure.reason = "there is no such file";
        failure.hint = "check the path";
        failure.status = exit_not_found;
    }
    return failure;
}

std::vector<std::string> SettingsFile::Lines() const
{
    StringList lines;
    if (TLIBFileReadLines(Path().c_str(), lines.Address()) < 0)
        throw Failed("read " + Path());
    return lines.Items();
}

std::vector<std::string> SettingsFile::Keys() const
{
    StringList lines;
    std::vector<std::string> keys;
    if (TLIBFileReadLines(Path().c_str(), lines.Address()) < 0)
        return keys;
    for (const std::string &line : lines.Items())
        if (const auto setting = SplitSetting(line))
            keys.push_back(setting->first);
    return keys;
}

const char *SettingsFile::LineFormat() const
{
    StringList lines;
    int quoted = 0;
    if (TLIBFileReadLines(Path().c_str(), lines.Address()) < 0)
        return nullptr;
    for (const std::string &line : lines.Items()) {
        const auto setting = SplitSetting(line);
        if (!setting)
            continue;
        if (line.find("=\"") == std::string::npos)
            return nullptr;
        ++quoted;
    }
    return quoted > 0 ? quoted_setting : nullptr;
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

const ArgumentKind setting_pair = {
    .name = "setting",
    .allowed = "KEY=VALUE",
    .valid = [](const std::string &pair) { return pair.find('=') != std::string::npos && pair.find('=') > 0; },
    .sample = "key=value",
    .wrong = "no pair",
};

std::pair<std::string, std::string> SplitPair(const std::string &pair)
{
    const std::size_t sign = pair.find('=');
    return {pair.substr(0, sign), pair.substr(sign + 1)};
}

}  // namespace tavoctl
