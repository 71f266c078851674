// A checkpoint of the whole network.
#include "network/detail/network_checkpoint.h"

#include "tavo_error.h"

#include "core/detail/boot_id.h"
#include "core/detail/file_rewrite.h"
#include "core/detail/log.h"
#include "core/detail/process_list.h"
#include "core/detail/run_command.h"
#include "core/detail/text_fields.h"
#include "network/detail/live_card.h"
#include "network/detail/process_identity.h"
#include "network/detail/undo_action.h"
#include "network/detail/whole_network.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include <unistd.h>

namespace tavo {
namespace {

constexpr const char *kRecordOfAll = "/etc/network.checkpoint";

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
    const auto structure = NetworkStructure();
    const bool is_as_recorded = std::any_of(steps.begin(), steps.end(), [&](const UndoStep &step) {
        return step.kind == UndoStep::structure && step.value == structure;
    });
    if (!is_as_recorded)
        RunCommandQuietly("/etc/rc.network stop > /dev/null 2>&1");
    PutBackFiles(steps);
    if (!is_as_recorded)
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
    if (!AddWholeNetwork(all))
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
