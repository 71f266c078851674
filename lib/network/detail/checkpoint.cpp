// The state of the network before a change: recording and restoring it.
#include "network/detail/checkpoint.h"

#include "core/detail/boot_id.h"
#include "core/detail/log.h"
#include "core/detail/open_file.h"
#include "core/detail/process_list.h"
#include "core/detail/text_fields.h"
#include "network/detail/connected_route.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/process_identity.h"
#include "network/detail/undo_action.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>

namespace tavo {
namespace {

constexpr const char *kRecord = "/etc/network.undo";

constinit int noted_in = -1;  // the record of the change that this process makes

// The first line of the record: the command in progress, its process once it has one. It is written over, so its length
// is fixed.
constexpr size_t kLongestCommand = 300;

std::string CommandLine(pid_t pid, const std::string &beginning, std::string_view command)
{
    const std::string text(command.substr(0, std::min(command.find(" >"), kLongestCommand)));
    char line[400];
    std::snprintf(line, sizeof line, "command %10d %20s %-*s\n", static_cast<int>(pid), beginning.c_str(),
                  static_cast<int>(kLongestCommand), text.c_str());
    return line;
}

// The process is noted when it runs, and its parent may have died just before; so the text counts, too. The same command
// that an administrator runs has called this, and waits for it.
void KillCommand(std::string_view line)
{
    const auto field = SplitFields(line);
    if (field.size() < 3 || field[0] != "command")
        return;
    EndProcess(ToPid(field[1]), field[2]);
    if (field.size() == 3)
        return;
    std::string_view text = line.substr(static_cast<size_t>(field[3].data() - line.data()));
    text = text.substr(0, text.find_last_not_of(' ') + 1);
    // One that is just being executed shows no text yet.
    constexpr int looks = 5;
    for (int i = 0; i < looks; ++i, ::usleep(10000)) {
        for (const Process &process : ListProcesses()) {
            if (process.pid != ::getpid() && process.command.find(text) != std::string::npos &&
                !IsAncestor(process.pid))
                EndProcess(process.pid, BeginningOf(process.pid));
        }
    }
}

}  // namespace

Checkpoint::~Checkpoint()
{
    if (record_)
        noted_in = -1;
}

void Checkpoint::Begin(Where where)
{
    if (noted_in >= 0 || ::geteuid() != 0)
        return;  // a part of a larger change, or of none that could come to pass
    const std::string text = CommandLine(0, "-", "") + "boot " + BootId() + UndoText(steps_);
    // The end mark shows that the record is complete: without it the change has not begun.
    ::unlink(kRecord);
    record_ = OpenFd(kRecord, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
    if (record_ && WriteAll(record_.Get(), text) && SyncFd(record_.Get())) {
        const Fd folder = OpenFd("/etc", O_RDONLY | O_DIRECTORY);
        if (folder)
            SyncFd(folder.Get());
        noted_in = record_.Get();
        return;
    }
    LogErrorAt(where, "%s:%d Fail to write [%s], errno=[%d/%s]", kRecord, errno, std::strerror(errno));
    ::unlink(kRecord);
    record_.Reset();
}

void Checkpoint::End()
{
    if (!record_)
        return;
    noted_in = -1;
    // One that cannot be removed would undo the change later: an empty one undoes nothing.
    if (::unlink(kRecord) != 0)
        (void)!::ftruncate(record_.Get(), 0);
    record_.Reset();
}

bool Checkpoint::PutBack(bool cleared)
{
    bool done = true;
    for (const UndoStep &step : steps_)
        done = (step.after_death || CarryOut(step, cleared)) && done;
    End();
    return done;
}

void Checkpoint::PutBackAll()
{
    for (const UndoStep &step : steps_)
        CarryOut(step, true);
    End();
}

void Checkpoint::PutBackFiles()
{
    for (const UndoStep &step : steps_) {
        if (step.IsOfFiles())
            CarryOut(step, false);
    }
}

void Checkpoint::NoteCommand(pid_t pid, const std::string &beginning, std::string_view command)
{
    if (noted_in < 0)
        return;
    const std::string line = CommandLine(pid, beginning, command);
    (void)!::pwrite(noted_in, line.data(), line.size(), 0);
}

void FinishCutOffChange(Where where)
{
    const auto text = ReadKernelFile(kRecord);
    if (!text)
        return;
    std::string_view rest = *text;
    const std::string_view command = TakeLine(rest);
    const std::string_view boot = rest.substr(0, rest.find('\n') + 1);
    rest.remove_prefix(boot.size());
    const auto steps = ParseUndo(rest);
    if (steps) {
        LogErrorAt(where, "%s:%d A change of the network was cut off. What it has changed is put back.");
        const bool same_boot = boot == "boot " + BootId();
        if (same_boot)
            KillCommand(command);
        for (const UndoStep &step : *steps) {
            if (same_boot || step.IsOfFiles())
                CarryOut(step, true);
        }
        if (same_boot)
            RepairRoutes();
    }
    ::unlink(kRecord);
}

}  // namespace tavo
