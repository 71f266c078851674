// tavoctl raid: starting arrays after a power failure, and new disks for failed ones.
#include "frame/files.h"
#include "storage/arrays.h"
#include "storage/device.h"
#include "storage/raid_verbs.h"
#include "storage/stopped_arrays.h"
#include "storage/system_tool.h"

#include <algorithm>
#include <filesystem>
#include <iostream>

namespace tavoctl {
namespace {

std::string ForceHint(const std::string &path)
{
    return "tavoctl raid assemble --force " + DeviceName(path) + " says what may be lost";
}

std::string ShortOf(const StoppedArray &array)
{
    const int there = array.UpToDate();
    return "only " + std::to_string(there) + " of " + std::to_string(array.slots) +
           " members are there and up to date, and it takes " + std::to_string(array.Needed());
}

// Why an array must not be started without being asked; empty when it may.
std::string WhyNot(const StoppedArray &array, const std::vector<StoppedArray> &all)
{
    const auto same_name = [&](const StoppedArray &other) { return other.path == array.path; };
    if (array.path.empty())
        return "its name holds no number: tavoctl raid assemble ARRAY " + array.uuid;
    if (Runs(array.path) || std::count_if(all.begin(), all.end(), same_name) > 1)
        return "another array has its name: tavoctl raid assemble ARRAY " + array.uuid;
    if (array.OnUsb())
        return "it is on a USB disk";
    if (array.UpToDate() < array.Needed())
        return ShortOf(array) + "; plug in the others, or " + ForceHint(array.path);
    return "";
}

// An array that an attempt has assembled but not started would hold the members.
void LetGo(const std::string &path)
{
    if (std::filesystem::exists(ArrayFile(path, "array_state")) && !Runs(path))
        RAIDStop(path.c_str());
}

bool Starts(const std::string &path, const std::string &uuid)
{
    LetGo(path);
    const bool started = RAIDAssemble(path.c_str(), uuid.c_str()) == 0;
    if (!started)
        LetGo(path);
    return started;
}

constexpr char was_written[] = "it was being written while it was not in order, so parts of it may be damaged";

void StartAll(Call &call, bool wake)
{
    const std::vector<StoppedArray> all = StoppedArrays(wake);
    std::vector<const StoppedArray *> safe;
    const auto leave = [&](const StoppedArray &array, const std::string &reason) {
        Warn((array.path.empty() ? array.uuid : array.path) + " is not started: " + reason);
        call.status = exit_failed;
    };
    for (const StoppedArray &array : all) {
        if (const std::string reason = WhyNot(array, all); !reason.empty()) {
            leave(array, reason);
        } else {
            safe.push_back(&array);
            call.Change(array.path, "status", "stopped", "running");
        }
    }
    if (!call.Proceed())
        return;
    for (const StoppedArray *array : safe) {
        if (Starts(array->path, array->uuid))
            continue;
        std::erase_if(call.report.changes, [&](const Change &change) { return change.object == array->path; });
        leave(*array, std::string(was_written) + "; " + ForceHint(array->path));
    }
}

StoppedArray FindStopped(const std::string &path, const std::string &uuid, bool wake)
{
    const std::string attempted = "start " + path;
    const std::vector<StoppedArray> all = StoppedArrays(wake);
    std::vector<StoppedArray> found;
    for (const StoppedArray &array : all)
        if (uuid.empty() ? array.path == path : array.uuid == uuid)
            found.push_back(array);
    if (found.empty())
        throw NotFound(attempted, ERR_PATH_NOT_FOUND, "tavoctl raid list --all shows the arrays that there are");
    RefuseIf(found.size() > 1, attempted, "several arrays have this name", "name the UUID, too");
    return found[0];
}

// The kernel starts arrays for reading only, until something is written. A rebuild waits for that, and so do readers of an
// array in the middle of a reshape.
void GoOn(const std::string &path, const std::string &attempted)
{
    if (KernelText(ArrayFile(path, "array_state")) == "read-auto")
        SetKernelText(ArrayFile(path, "array_state"), "active", attempted);
}

// Everything that its members have, whatever they say of each other.
void ForceStart(Call &call, const std::string &path, const StoppedArray &array)
{
    const std::string attempted = "start " + path;
    const std::vector<std::string> members = array.Describe();
    call.Tell("members", members);
    const bool lacks = array.UpToDate() < array.Needed();
    const std::string loss =
        lacks ? "Outdated members are used as they are: data written since then may be lost or damaged."
              : "Data that was being written when the power failed may be damaged, also in neighbouring blocks; "
                "data written before is intact.";
    call.Tell("risk", loss);
    if (!call.json) {
        for (const std::string &line : members)
            std::cerr << Printable(line) << "\n";
        std::cerr << loss << "\n";
    }
    call.Change(path, "status", "stopped", "running");
    if (!call.Proceed("Start " + path + " nevertheless?"))
        return;
    LetGo(path);
    const ToolResult careful = TryTool({"/sbin/mdadm", "-A", "-v", path, "-u", array.uuid});
    if (!Runs(path)) {
        LetGo(path);
        // The power failed after a reshape was asked for and before the copy of its first stripes was written that mdadm
        // looks for: nothing was moved.
        if (careful.output.find("Failed to find backup of critical section") != std::string::npos &&
            careful.output.find("No backup metadata on") != std::string::npos)
            RunTool({"/sbin/mdadm", "-A", path, "--update=revert-reshape", "--invalid-backup", "-u", array.uuid},
                    attempted);
        else
            RunTool({"/sbin/mdadm", "-A", path, "--force", "--run", "-u", array.uuid}, attempted);
    }
    if (Runs(path)) {
        GoOn(path, attempted);
    } else {
        LetGo(path);
        throw Failure{.attempted = attempted, .reason = ShortOf(array), .hint = log_hint};
    }
}

// The member that is to go, or "" where the library finds it.
std::string OldMember(const RAIDINFO &info, const std::string &word, const std::string &attempted)
{
    const std::vector<std::string> active = Members(info, RAID_MEMBER_ACTIVE);
    const auto is_gone = [](const std::string &path) { return !std::filesystem::exists(path); };
    if (word.empty()) {
        std::vector<std::string> gone = Members(info, RAID_MEMBER_FAILED | RAID_MEMBER_FATAL);
        std::copy_if(active.begin(), active.end(), std::back_inserter(gone), is_gone);
        RefuseIf(gone.size() > 1, attempted, Joined(gone, ", ") + " are gone", "name the one that is replaced first");
        FailIf(gone.empty() && static_cast<int>(Members(info, ~0).size()) >= info.nSlot, attempted,
               "no member has failed or was pulled, and no slot is free");
        return gone.empty() ? "" : gone[0];
    }
    const std::string path = MemberOf(info, word);
    if (path.empty())
        throw NotFound(attempted, ERR_PATH_NOT_FOUND, DevicePath(word) + " is not a member");
    BusyIf(Contains(active, path) && !is_gone(path), attempted, path + " is in sync");
    return path;
}

}  // namespace

Action RaidStart(Arguments &in)
{
    const auto word = in.OptionalText("ARRAY", array_kind, array_help);
    const auto given = in.OptionalText("UUID", any_text, "of the array, as raid superblock shows it");
    const auto all = in.Flag("--all", "every array that does not run");
    const auto force = in.Flag("--force", "also when its members disagree; asks");
    const auto wake = in.Flag("--wake", "read the disks although that wakes them");
    return [=](Call &call) {
        RefuseIf(*all + word->has_value() != 1 || (*all && *force), "start arrays",
                 "name an array, or use --all without --force");
        if (*all)
            return StartAll(call, *wake);
        const std::string path = ArrayPath(**word);
        std::string uuid = given->value_or("");
        if (uuid.empty() && Runs(path))
            return;
        if (*force)
            return ForceStart(call, path, FindStopped(path, uuid, *wake));
        if (uuid.empty())
            uuid = FindStopped(path, uuid, *wake).uuid;
        call.Change(path, "status", {}, "running");
        if (call.Proceed())
            Must(Starts(path, uuid), "start " + path,
                 HintFor{ERR_SUCCESS, "look at the system log; tavoctl raid assemble --force says what may be lost"});
    };
}

Action RaidReplace(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto words = in.Texts("DISK", device_kind, "the member that goes, and the new disk; or the new disk alone");
    const auto wait = in.Flag("--wait", "until the rebuild has ended");
    return [=](Call &call) {
        const Array array = ReadArray(ArrayPath(*word));
        const std::string name = array->szPath;
        const std::string attempted = "replace a member of " + name;
        RefuseIf(words->size() > 2, attempted, "one disk takes the place of one member");
        RefuseIf(!disk_kind.valid(words->back()), attempted, words->back() + " is not a whole disk",
                 "name the disk, such as sdd");
        const std::string disk = DiskPath(words->back());
        const std::string old = OldMember(*array, words->size() == 2 ? words->front() : "", attempted);
        if (const std::string member = MemberOf(*array, disk); !member.empty() && member != old)
            throw BusyFailure(attempted, member + " is a member already");
        // A disk that serves other arrays already has its partitions and keeps them.
        if (ArraysOf(ReadArrays(), disk).empty())
            RefuseUsed({disk}, attempted);
        call.Change(name, "members", Maybe(old), disk);
        if (call.Proceed("Lose what is on " + disk + "?"))
            Must(RAIDReplaceDisk(array.get(), old.empty() ? nullptr : old.c_str(), disk.c_str()) == 0, attempted,
                 HintFor{ERR_NOT_ENOUGH_SPACE, "take a larger one", log_hint});
        if (*wait && !call.dry_run)
            WaitForArray(name, 0);
    };
}

}  // namespace tavoctl
