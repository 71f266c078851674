// Keeps the credentials of the network backup service in step with the accounts.
#include "account/detail/net_backup_users.h"

#include "core/detail/file_rewrite.h"
#include "core/detail/line_reader.h"

#include <functional>
#include <optional>

#include <strings.h>

namespace tavo {
namespace {

constexpr char kAuthorised[] = "/usr/tavo/etc/netbkp.users";
constexpr char kSecrets[] = "/etc/rsyncd.secrets";

std::string ServiceName(const std::string &name)
{
    return ::strcasecmp(name.c_str(), "admin") == 0 ? "root" : name;
}

bool SameName(std::string_view left, const std::string &right)
{
    return ::strcasecmp(std::string(left).c_str(), right.c_str()) == 0;
}

std::string_view NameOf(std::string_view line)
{
    return WithoutNewline(line.substr(0, line.find(':')));
}

// Replaces the lines of `name` by what `change` makes of them ("" takes one out). False when the file cannot be read or
// rewritten; a missing one has no lines. Says whether there was such a line.
bool ChangeLines(const char *path, const std::string &name, bool &found,
                 const std::function<std::string(std::string_view line)> &change)
{
    found = false;
    FileRewrite file;
    if (file.Open(path) != 0)
        return file.IsMissing();
    std::string text;
    if (!file.Read(text))
        return false;
    std::string changed;
    for (std::string_view rest = text; !rest.empty();) {
        const std::string_view line = TakeWholeLine(rest);
        const bool same = SameName(NameOf(line), name);
        found = found || same;
        changed += same ? change(line) : std::string(line);
    }
    return changed == text || file.Replace(changed, 0600) == 0;
}

bool AddLine(const char *path, const std::string &line)
{
    FileRewrite file;
    std::string text;
    if (file.Open(path) != 0) {
        if (!file.IsMissing())
            return false;
    } else if (!file.Read(text)) {
        return false;
    }
    if (!text.empty() && !text.ends_with('\n'))
        text += '\n';
    return file.Replace(text + line + '\n', 0600) == 0;
}

}  // namespace

bool SetNetBackupUser(const std::string &old_name, const std::string &name, const char *password)
{
    const std::string before = old_name.empty() ? name : old_name;
    bool authorised = false;
    if (!ChangeLines(kAuthorised, before, authorised, [&](std::string_view) { return name + '\n'; }))
        return false;
    if (!authorised)
        return true;
    bool known = false;
    const bool done = ChangeLines(kSecrets, ServiceName(before), known, [&](std::string_view line) {
        const size_t colon = line.find(':');
        const std::string_view kept = colon == line.npos ? std::string_view(":\n") : line.substr(colon);
        return ServiceName(name) + (password ? ":" + std::string(password) + '\n' : std::string(kept));
    });
    return done && (known || !password || AddLine(kSecrets, ServiceName(name) + ':' + password));
}

bool RemoveNetBackupUser(const std::string &name)
{
    bool found = false;
    const auto nothing = [](std::string_view) {
        return std::string();
    };
    return ChangeLines(kAuthorised, name, found, nothing) &&
           (!found || ChangeLines(kSecrets, ServiceName(name), found, nothing));
}

}  // namespace tavo
