// A checkpoint of the whole network.
#include "network/detail/network_checkpoint.h"

#include "tavo_error.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/boot_id.h"
#include "core/detail/file_rewrite.h"
#include "core/detail/key_value_line.h"
#include "core/detail/log.h"
#include "core/detail/process_list.h"
#include "core/detail/run_command.h"
#include "core/detail/text_fields.h"
#include "network/detail/checkpoint.h"
#include "network/detail/connected_route.h"
#include "network/detail/folder_names.h"
#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/live_card.h"
#include "network/detail/process_identity.h"
#include "network/detail/undo_action.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include <unistd.h>

namespace tavo {
namespace {

constexpr const char *kRecordOfAll = "/etc/network.checkpoint";
// Files and keys that describe the network, besides /etc/sysconfig/network, /etc/hosts and /etc/resolv.conf.
constexpr const char *kFileStems[] = {"ifcfg-", "more-", "search"};
constexpr const char *kKeyTails[] = {"_mtu", "_wol_options"};

// Empty when they cannot be read.
std::optional<std::vector<std::string>> Interfaces()
{
    auto names = FolderNames("/sys/class/net/");
    if (!names)
        return std::nullopt;
    std::erase_if(*names, [](const std::string &name) { return InterfaceAttribute(name, "type") != "1"; });
    std::sort(names->begin(), names->end());
    return names;
}

// Which interfaces there are, and which is a part of which.
std::string StructureText(const std::vector<std::string> &interfaces)
{
    std::string text;
    for (const std::string &name : interfaces)
        text += name + " " + InterfaceAttribute(name, "iflink") + " " + InterfaceAttribute(name, "bonding/mode") + " " +
                InterfaceAttribute(name, "bonding/slaves") + "\n";
    return text;
}

bool AddFolder(Checkpoint &all)
{
    const auto names = FolderNames(kInterfaceFolder);
    if (!names)
        return false;
    for (const char *stem : kFileStems) {
        std::string there;
        for (const std::string &name : *names) {
            if (!name.starts_with(stem))
                continue;
            if (!all.AddFile(kInterfaceFolder + name))
                return false;
            there += name + "\n";
        }
        all.Add({UndoStep::only_files, kInterfaceFolder, there, stem});
    }
    return true;
}

void AddSettings(Checkpoint &all)
{
    const std::string text = ReadKernelFile(kSettings).value_or("");
    for (const char *tail : kKeyTails) {
        std::string there;
        for (std::string_view rest = text; !rest.empty();) {
            const std::string key(LineKey(TakeLine(rest)));
            if (!key.ends_with(tail))
                continue;
            all.AddSetting(kSettings, key);
            there += key + "\n";
        }
        all.Add({UndoStep::only_settings, kSettings, there, tail});
    }
}

bool AddAll(Checkpoint &all)
{
    const auto interfaces = Interfaces();
    if (!interfaces)
        return false;
    all.Add({UndoStep::structure, {}, StructureText(*interfaces), {}});
    for (const char *path : {kNetworkFile, kResolverFile, "/etc/hosts"}) {
        if (!all.AddFile(path))
            return false;
    }
    if (!AddFolder(all))
        return false;
    AddSettings(all);
    all.AddHostName();
    for (const std::string &interface : *interfaces)
        all.AddLiveCard(interface);
    return true;
}

struct Record {
    pid_t owner = 0;
    std::string beginning;
    bool is_of_this_boot = false;
    std::vector<UndoStep> steps;

    bool HasOwner() const { return is_of_this_boot && BeginningOf(owner) == beginning && !IsZombie(owner); }
};

// Empty without one; one that was cut off before it was whole has no steps.
std::optional<Record> ReadRecord()
{
    const auto text = ReadKernelFile(kRecordOfAll);
    if (!text)
        return std::nullopt;
    std::string_view rest = *text;
    const auto owner = SplitFields(TakeLine(rest));
    const std::string_view boot = rest.substr(0, rest.find('\n') + 1);
    rest.remove_prefix(boot.size());
    Record record;
    if (owner.size() == 3 && owner[0] == "owner") {
        record.owner = ToPid(owner[1]);
        record.beginning = owner[2];
    }
    record.is_of_this_boot = boot == "boot " + BootId();
    record.steps = ParseUndo(rest).value_or(std::vector<UndoStep>());
    return record;
}

void PutBackFiles(const std::vector<UndoStep> &steps)
{
    for (const UndoStep &step : steps) {
        if (step.IsOfFiles())
            CarryOut(step, false);
    }
}

// Unchanged parts are not touched, because the other cards of the appliance are in use.
int PutBackAll(const std::vector<UndoStep> &steps)
{
    const auto interfaces = Interfaces();
    const bool stands = interfaces && std::any_of(steps.begin(), steps.end(), [&](const UndoStep &step) {
                            return step.kind == UndoStep::structure && step.value == StructureText(*interfaces);
                        });
    if (!stands)
        RunCommandQuietly("/etc/rc.network stop > /dev/null 2>&1");
    PutBackFiles(steps);
    if (!stands)
        RunCommandQuietly("/etc/rc.network start > /dev/null 2>&1");
    bool wanted = true;
    bool done = true;
    for (const UndoStep &step : steps) {
        if (step.kind == UndoStep::card)
            wanted = LiveCardText(step.target) != step.value;
        else if (wanted && !step.IsOfFiles())
            done = CarryOut(step, true) && done;
    }
    return done ? 0 : ERR_OP_FAILURE;
}

}  // namespace

int TakeNetworkCheckpoint(Where where)
{
    const auto old = ReadRecord();
    if (old && old->HasOwner())
        return ERR_FILE_EXISTS;
    Checkpoint all;
    if (!AddAll(all))
        return ERR_READ_FAILED;
    const pid_t self = ::getpid();
    const std::string text =
        "owner " + std::to_string(self) + " " + BeginningOf(self) + "\nboot " + BootId() + UndoText(all.Steps());
    FileRewrite rewrite;
    int code = rewrite.Open(kRecordOfAll);
    if (code == 0 || rewrite.IsMissing())
        code = rewrite.Replace(text, 0600);
    if (code != 0)
        LogErrorAt(where, "%s:%d Fail to write [%s], errno=[%d/%s]", kRecordOfAll, errno, std::strerror(errno));
    return code;
}

int EndNetworkCheckpoint()
{
    if (::unlink(kRecordOfAll) == 0)
        return 0;
    return errno == ENOENT ? ERR_FILE_NOT_FOUND : ERR_REMOVE_FAILED;
}

int PutBackNetworkCheckpoint()
{
    const auto record = ReadRecord();
    if (!record || record->steps.empty())
        return ERR_FILE_NOT_FOUND;
    const int code = PutBackAll(record->steps);
    const int ended = EndNetworkCheckpoint();
    return code != 0 ? code : ended;
}

void PutBackAbandonedCheckpoint(Where where)
{
    const auto record = ReadRecord();
    if (!record || record->HasOwner())
        return;
    LogErrorAt(where, "%s:%d A change of the network was neither kept nor given up. The network is put back.");
    if (record->is_of_this_boot)
        PutBackAll(record->steps);
    else
        PutBackFiles(record->steps);
    EndNetworkCheckpoint();
}

}  // namespace tavo
