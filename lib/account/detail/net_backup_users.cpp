// Keeps the credentials of the network backup service in step with the accounts.
#include "account/detail/net_backup_users.h"

#include <strings.h>

namespace tavo {
namespace {

std::string ServiceName(const std::string &name)
{
    return ::strcasecmp(name.c_str(), "admin") == 0 ? "root" : name;
}

std::string Nothing(std::string_view)
{
    return {};
}

}  // namespace

bool NetBackupUsers::Set(const std::string &old_name, const std::string &name, const char *password)
{
    const std::string before = old_name.empty() ? name : old_name;
    if (!authorised_.Read())
        return false;
    if (!authorised_.Change(before, [&](std::string_view) { return name + '\n'; }))
        return true;
    if (!secrets_.Read())
        return false;
    // A line end in the password would begin a new line, such as credentials for another user.
    if (password && std::string_view(password).find_first_of("\r\n") != std::string_view::npos) {
        secrets_.Change(ServiceName(before), Nothing);
        return false;
    }
    const bool known = secrets_.Change(ServiceName(before), [&](std::string_view line) {
        const size_t colon = line.find(':');
        const std::string_view kept = colon == line.npos ? std::string_view(":\n") : line.substr(colon);
        return ServiceName(name) + (password ? ":" + std::string(password) + '\n' : std::string(kept));
    });
    if (!known && password)
        secrets_.Append(ServiceName(name) + ':' + password);
    return true;
}

bool NetBackupUsers::Remove(const std::string &name)
{
    if (!authorised_.Read())
        return false;
    if (!authorised_.Change(name, Nothing))
        return true;
    if (!secrets_.Read())
        return false;
    secrets_.Change(ServiceName(name), Nothing);
    return true;
}

// The secrets of a user who loses the authorisation are removed first.
Code NetBackupUsers::Compose(unsigned target, AccountCommit &commit)
{
    const Code code = secrets_.Compose(target, 0600, commit);
    return code != 0 ? code : authorised_.Compose(target, 0600, commit);
}

}  // namespace tavo
