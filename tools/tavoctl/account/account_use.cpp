// Finds the uses of an account or a group on the appliance.
#include "account/account_use.h"

#include "account/account_check.h"
#include "account/account_rules.h"
#include "frame/files.h"
#include "frame/processes.h"
#include "frame/text.h"

#include <cerrno>
#include <csignal>
#include <cstring>

#include <strings.h>
#include <utmpx.h>

namespace tavoctl {
namespace {

// The terminal of a session; empty without one. A session whose process died does not count.
std::string SessionOf(const std::string &name)
{
    std::string terminal;
    ::setutxent();
    while (const utmpx *entry = ::getutxent()) {
        const std::string user(entry->ut_user, ::strnlen(entry->ut_user, sizeof entry->ut_user));
        const bool lives = ::kill(entry->ut_pid, 0) == 0 || errno == EPERM;
        // A longer name is cut off there.
        const bool same = ::strcasecmp(user.c_str(), name.substr(0, sizeof entry->ut_user).c_str()) == 0;
        if (entry->ut_type == USER_PROCESS && same && lives) {
            terminal.assign(entry->ut_line, ::strnlen(entry->ut_line, sizeof entry->ut_line));
            break;
        }
    }
    ::endutxent();
    return terminal;
}

// Returns whether one of the process's user ids is this one: real, effective, saved, or of its file accesses.
bool RunsAs(pid_t pid, uid_t uid)
{
    const std::string status = FileText("/proc/" + std::to_string(pid) + "/status");
    for (const std::string &line : Split(status, '\n'))
        if (line.starts_with("Uid:"))
            return Contains(Split(line, '\t'), std::to_string(uid));
    return false;
}

std::vector<pid_t> ProcessesOf(uid_t uid)
{
    std::vector<pid_t> found;
    for (const std::string &name : FolderNames("/proc"))
        if (const auto pid = NumberIn<pid_t>(name); pid && RunsAs(*pid, uid) && !CommandLine(*pid).empty())
            found.push_back(*pid);
    return found;
}

}  // namespace

std::string UseOfUser(const std::string &name, uid_t uid)
{
    if (const std::string terminal = SessionOf(name); !terminal.empty())
        return "logged in at " + terminal;
    const std::vector<pid_t> pids = ProcessesOf(uid);
    if (pids.empty())
        return {};
    const std::string first = std::to_string(pids.front()) + " (" + CommandLine(pids.front()) + ")";
    return pids.size() == 1 ? "running the process " + first
                            : "running " + std::to_string(pids.size()) + " processes, the first is " + first;
}

std::string UsersWithPrimaryGroup(gid_t gid)
{
    constexpr std::size_t gid_field = 3;
    std::vector<std::string> names;
    for (const auto &fields : FieldsIn("/etc/passwd"))
        if (fields.size() > gid_field && fields[gid_field] == std::to_string(gid))
            names.push_back(fields[0]);
    return SomeOf(names);
}

}  // namespace tavoctl
