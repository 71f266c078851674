// Carries out what puts a piece of the network back.
#include "network/detail/undo_action.h"

#include "tavo_file.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/keep_fault.h"
#include "core/detail/key_value_line.h"
#include "core/detail/lock_hold.h"
#include "core/detail/process_list.h"
#include "core/detail/run_command.h"
#include "core/detail/strict_number.h"
#include "core/detail/text_fields.h"
#include "network/detail/connected_route.h"
#include "network/detail/dhcp_client.h"
#include "network/detail/file_state.h"
#include "network/detail/folder_names.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/process_identity.h"
#include "network/detail/wake_on_lan.h"

#include <algorithm>

#include <unistd.h>

namespace tavo {
namespace {

void EndClients(const UndoStep &step)
{
    for (const Process &process : ListProcesses()) {
        const auto words = SplitFields(process.command);
        if (words.empty() || !words[0].substr(words[0].rfind('/') + 1).starts_with("dhcpcd") ||
            std::find(words.begin() + 1, words.end(), step.target) == words.end())
            continue;
        const std::string beginning = BeginningOf(process.pid);
        if (process.pid != ToPid(step.value) || beginning != step.more)
            EndProcess(process.pid, beginning);
    }
}

LockHold LockFor(const UndoStep &step)
{
    const bool shared = step.target == kSettings;
    return LockHold(shared ? TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING : TAVO_LOCK_EXCLUSIVE, 5);
}

void PutBackSetting(const UndoStep &step)
{
    const KeepFault keep;
    const LockHold lock = LockFor(step);
    if (step.kind == UndoStep::setting)
        TLIBFileSetKeyValue(step.target.c_str(), step.more.c_str(), step.value.c_str(), nullptr);
    else
        TLIBFileRemoveKey(step.target.c_str(), step.more.c_str());
}

bool IsListed(std::string_view lines, std::string_view line)
{
    while (!lines.empty()) {
        if (TakeLine(lines) == line)
            return true;
    }
    return false;
}

void RemoveOtherFiles(const UndoStep &step)
{
    for (const std::string &name : FolderNames(step.target.c_str()).value_or(std::vector<std::string>())) {
        if (name.starts_with(step.more) && !IsListed(step.value, name))
            ::unlink((step.target + name).c_str());
    }
}

void RemoveOtherSettings(const UndoStep &step)
{
    const KeepFault keep;
    const LockHold lock = LockFor(step);
    const std::string text = ReadKernelFile(step.target.c_str()).value_or("");
    for (std::string_view rest = text; !rest.empty();) {
        const std::string key(LineKey(TakeLine(rest)));
        if (key.ends_with(step.more) && !IsListed(step.value, key))
            TLIBFileRemoveKey(step.target.c_str(), key.c_str());
    }
}

mode_t ToMode(const std::string &text)
{
    return LeadingNumber<mode_t>(text, 0644, 8);
}

void TellCard(const UndoStep &step)
{
    const auto bits = LeadingNumber<uint32_t>(step.value);
    const auto now = GetWakeSettings(step.target.c_str());
    if (now && now->enabled != bits)
        SetWakeOptions(step.target.c_str(), bits);
}

bool IsLive(const std::string &route)
{
    const auto live = LiveRoutes();
    return std::any_of(live.begin(), live.end(), [&](const Route &one) { return RouteText(one) == route; });
}

}  // namespace

bool CarryOut(const UndoStep &step, bool cleared)
{
    switch (step.kind) {
    case UndoStep::file:
        PutBack(FileState{step.target, step.value, ToMode(step.more)});
        return true;
    case UndoStep::no_file:
        PutBack(FileState{step.target, std::nullopt, 0});
        return true;
    case UndoStep::only_files:
        RemoveOtherFiles(step);
        return true;
    case UndoStep::setting:
    case UndoStep::no_setting:
        PutBackSetting(step);
        return true;
    case UndoStep::only_settings:
        RemoveOtherSettings(step);
        return true;
    case UndoStep::host_name:
        (void)!::sethostname(step.target.c_str(), step.target.size());
        return true;
    case UndoStep::command:
        RunCommandQuietly(step.target);
        return true;
    case UndoStep::address:
        return RunCommandQuietly(step.target) == 0;
    case UndoStep::route:
        if (cleared || !IsLive(step.value))
            RunCommandQuietly(step.target);
        return true;
    case UndoStep::end_clients:
        EndClients(step);
        return true;
    case UndoStep::wake:
        TellCard(step);
        return true;
    case UndoStep::client:
        if (DhcpClientOf(step.target) == 0)
            StartDhcpClient(step.target);
        return true;
    case UndoStep::structure:
    case UndoStep::card:
        return true;  // conditions for the steps after them
    }
    return true;
}

}  // namespace tavo
