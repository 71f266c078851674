// tavoctl raid: making, mending and stopping arrays.
#include "tavo_appliance.h"

#include "frame/containers.h"
#include "frame/files.h"
#include "storage/arrays.h"
#include "storage/device.h"
#include "storage/raid_verbs.h"
#include "storage/system_tool.h"

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <numeric>
#include <string_view>
#include <thread>

namespace tavoctl {
namespace {

std::string LossOf(const std::vector<std::string> &paths)
{
    return "Lose what is on " + Joined(paths, ", ") + "?";
}

void RefuseTwice(std::vector<std::string> paths, const std::string &attempted)
{
    std::sort(paths.begin(), paths.end());
    const auto twice = std::adjacent_find(paths.begin(), paths.end());
    if (twice != paths.end())
        throw UsageFailure(attempted, *twice + " is named twice");
}

// How large an array of these members will be, at most.
uint64_t SizeToBe(int level, const std::vector<std::string> &paths, int slots, uint64_t limit)
{
    uint64_t least = limit ? limit : ~uint64_t{0};
    for (const std::string &path : paths) {
        least = std::min(least, SizeOfAll({path}));
    }
    switch (level) {
    case RAID_LEVEL_0:
    case RAID_LEVEL_LINEAR:
        return SizeOfAll(paths);
    case RAID_LEVEL_10:
        return least * static_cast<uint64_t>(slots) / 2;
    default:
        return least * static_cast<uint64_t>(slots - RAIDParityDiskCount(level, slots));
    }
}

void RefuseUsedArray(const std::string &path, const std::string &attempted)
{
    if (const std::string use = UseOf(path); !use.empty())
        throw BusyFailure(attempted, use, "free it first");
}

// To all the room that the members have.
void GrowMembers(Call &call, const RAIDINFO &array, const std::string &attempted)
{
    constexpr uint64_t kib = 1024;
    const std::string name = array.szPath;
    uint64_t room = 0;
    const int expansible = RAIDExpansible(&array, &room);
    Must(expansible >= 0, attempted, log_hint);
    if (expansible == 0)
        return;
    RefuseTooLarge(SizeToBe(array.fLevel, {}, array.nSlot, room * kib), attempted);
    call.Change(name, "member_size", array.cbMember, room * kib);
    if (!call.Proceed())
        return;
    const bool limited = RAIDSizeLimitGet() > 0;
    RunTool({"/sbin/mdadm", "--grow", name, "--size=" + (limited ? std::to_string(room) : "max")}, attempted);
    // The superblock may need what looked like room.
    if (ReadArray(name)->cbMember == array.cbMember)
        call.report.changes.clear();
}

// KiB between the superblock and the data of a member.
uint64_t RoomBeforeData(const std::string &member)
{
    constexpr std::string_view label = "Unused Space : before=";
    const std::string text = TryTool({"/sbin/mdadm", "-E", member}).output;
    const std::size_t at = text.find(label);
    return at == text.npos ? 0 : std::strtoull(text.c_str() + at + label.size(), nullptr, 10) / 2;
}

// The KiB by which the data of each member moves towards its beginning when it is spread over more of them; 0 for levels
// whose data does not move.
uint64_t ReshapeDistance(const RAIDINFO &array, int slots)
{
    if (array.fLevel != RAID_LEVEL_5 && array.fLevel != RAID_LEVEL_6)
        return 0;
    const int parity = RAIDParityDiskCount(array.fLevel, array.nSlot);
    const int data = array.nSlot - parity;
    const auto chunk =
        std::strtoull(KernelText(ArrayFile(array.szPath, "chunk_size")).value_or("").c_str(), nullptr, 10);
    return chunk / 1024 * static_cast<uint64_t>(std::lcm(data, slots - parity) / data);
}

// With enough room before the data it never moves onto what has not been moved yet. Without it mdadm keeps a copy of the
// first stripes meanwhile; when the power fails before that is written, the array does not start any more.
void RefuseUnsafeReshape(const RAIDINFO &array, uint64_t needed, const std::string &attempted)
{
    if (needed == 0)
        return;
    for (const std::string &member : Members(array, ~0)) {
        const uint64_t room = RoomBeforeData(member);
        FailIf(room < needed, attempted,
               member + " has " + std::to_string(room) + " KiB of room before its data, and it takes " +
                   std::to_string(needed) + " to survive a power failure meanwhile",
               "make a new array");
    }
}

// No signal ends the program in between: the array would wait for ever.
class Undisturbed {
  public:
    Undisturbed()
    {
        sigset_t signals;
        ::sigemptyset(&signals);
        for (const int number : {SIGINT, SIGQUIT, SIGTERM, SIGHUP})
            ::sigaddset(&signals, number);
        ::sigprocmask(SIG_BLOCK, &signals, &before_);
    }
    ~Undisturbed() { ::sigprocmask(SIG_SETMASK, &before_, nullptr); }
    Undisturbed(const Undisturbed &) = delete;
    Undisturbed &operator=(const Undisturbed &) = delete;

  private:
    sigset_t before_;
};

// The kernel writes down how far a reshape is before it overwrites what was moved since. But it counts with the room before
// the data only from the next start of the array on, so a power failure in the first seconds would lose the first stripes.
// Stopped where that room ends, it writes down that they were moved.
void SpreadOver(const RAIDINFO &array, int slots, uint64_t distance, const std::string &attempted)
{
    const std::string limit = ArrayFile(array.szPath, "sync_max");
    const uint64_t sectors = distance * 2;
    const Undisturbed undisturbed;
    if (sectors > 0)
        SetKernelText(limit, std::to_string(sectors), attempted);
    const bool begun = RAIDDevCountChange(&array, slots) == 0;
    const uint64_t moved = sectors * static_cast<uint64_t>(slots - RAIDParityDiskCount(array.fLevel, slots));
    while (begun && sectors > 0 && KernelText(ArrayFile(array.szPath, "sync_action")) == "reshape") {
        const std::string position = KernelText(ArrayFile(array.szPath, "reshape_position")).value_or("none");
        if (position == "none" || std::strtoull(position.c_str(), nullptr, 10) >= moved)
            break;
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
    }
    if (sectors > 0)
        SetKernelText(limit, "max", attempted);
    Must(begun, attempted, log_hint);
}

void GrowSlots(Call &call, const RAIDINFO &array, const std::vector<std::string> &paths, const std::string &attempted)
{
    const std::string name = array.szPath;
    const int slots = array.nSlot + static_cast<int>(paths.size());
    const uint64_t distance = ReshapeDistance(array, slots);
    RefuseUnsafeReshape(array, distance, attempted);
    RefuseTwice(paths, attempted);
    RefuseUsed(paths, attempted);
    RefuseTooLarge(SizeToBe(array.fLevel, {}, slots, array.cbMember), attempted);
    call.Change(name, "members", {}, paths);
    call.Change(name, "slots", array.nSlot, slots);
    if (!call.Proceed(LossOf(paths)))
        return;
    for (const std::string &path : paths)
        Must(RAIDAddRobustCheck(&array, path.c_str()) == 0, "add " + path + " to " + name,
             HintFor{ERR_NOT_ENOUGH_SPACE, "take a larger one", log_hint});
    SpreadOver(array, slots, distance, attempted);
}

}  // namespace

Action RaidCreate(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto words = in.Texts("MEMBER", device_kind, member_help);
    const auto level = in.OptionalChoice("--level", "LEVEL", {"0", "1", "5", "6", "10", "linear"}, "required");
    const auto slots = in.Number("--slots", "SLOTS", "members that it is made for, without spares", 1, 99);
    const auto spares = in.Number("--spares", "SPARES", "how many of the members are spares (0)", 0, 99);
    const auto size = in.Number("--size", "MIB", "what is used of each member; 0: all (0)");
    const auto no_sync = in.Flag("--no-sync", "take the members as being in sync: for new disks that are all zero");
    return [=](Call &call) {
        const std::string path = ArrayPath(*word);
        const std::string attempted = "make the array " + path;
        RefuseIf(!*level, attempted, "--level is required", "0, 1, 5, 6, 10 or linear");
        const std::vector<std::string> paths = DevicePaths(*words);
        RefuseTwice(paths, attempted);
        BusyIf(Runs(path), attempted, "it runs", "stop it first");
        RefuseUsed(paths, attempted);
        const auto spare = static_cast<int>(spares->value_or(0));
        const int active = std::max(static_cast<int>(paths.size()) - spare, 1);
        const auto slot_count = static_cast<int>(slots->value_or(active));
        const uint64_t member_size = static_cast<uint64_t>(size->value_or(0)) << 20;
        RefuseTooLarge(SizeToBe(*LevelOf(**level), paths, slot_count, member_size), attempted);
        call.Change(path, "level", {}, LevelText(*LevelOf(**level)));
        call.Change(path, "members", {}, paths);
        if (!call.Proceed(LossOf(paths)))
            return;
        const StringList members(paths);
        const RAIDREQUEST request = {.szPath = path.c_str(),
                                     .pVersion = nullptr,
                                     .fLevel = *LevelOf(**level),
                                     .nSpare = spare,
                                     .nSlot = slot_count,
                                     .cbArray = member_size,
                                     .pslMembers = members.Get(),
                                     .fSync = *no_sync ? 0 : 1};
        Must(RAIDCreate(&request) == 0, attempted, log_hint);
    };
}

Action RaidAdd(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto words = in.Texts("MEMBER", device_kind, member_help);
    return [=](Call &call) {
        const Array array = ReadArray(ArrayPath(*word));
        const std::vector<std::string> paths = DevicePaths(*words);
        const std::string attempted = "add " + Joined(paths, ", ") + " to " + array->szPath;
        FailIf(array->fLevel == RAID_LEVEL_0, attempted, "a RAID 0 takes no members");
        RefuseUsed(paths, attempted);
        for (const std::string &path : paths)
            call.Change(array->szPath, "members", {}, path);
        if (!call.Proceed(LossOf(paths)))
            return;
        for (const std::string &path : paths)
            Must(RAIDAddRobustCheck(array.get(), path.c_str()) == 0, "add " + path + " to " + array->szPath,
                 HintFor{ERR_NOT_ENOUGH_SPACE, "take a larger one", log_hint});
    };
}

Action RaidTakeOut(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto words = in.Texts("MEMBER", device_kind, member_help, 0);
    return [=](Call &call) {
        const Array array = ReadArray(ArrayPath(*word));
        const std::string name = array->szPath;
        const std::vector<std::string> all = Members(*array, ~0);
        if (words->empty()) {
            RefuseUsedArray(name, "remove " + name);
            call.Change(name, "members", all, {});
            if (call.Proceed("Lose the array " + name + " and what is on it?"))
                Must(RAIDRemove(array.get()) == 0, "remove " + name, log_hint);
            return;
        }
        const std::vector<std::string> paths = DevicePaths(*words);
        const std::string attempted = "remove " + Joined(paths, ", ") + " from " + name;
        const std::vector<std::string> active = Members(*array, RAID_MEMBER_ACTIVE);
        for (const std::string &path : paths) {
            BusyIf(Contains(active, path), attempted, path + " is in sync");
            if (!Contains(all, path))
                throw NotFound(attempted, ERR_PATH_NOT_FOUND, path + " is not a member");
            call.Change(name, "members", path, {});
        }
        if (!call.Proceed("Remove " + Joined(paths, ", ") + " from " + name + "?"))
            return;
        for (const std::string &path : paths)
            Must(RAIDRemoveDisk(array.get(), path.c_str()) == 0, "remove " + path + " from " + name, log_hint);
    };
}

Action RaidGrow(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto words = in.Texts("MEMBER", device_kind, member_help, 0);
    const auto wait = in.Flag("--wait", "until the array is in order in its new size");
    return [=](Call &call) {
        const Array array = ReadArray(ArrayPath(*word));
        const std::string name = array->szPath;
        const std::string attempted = "grow " + name;
        FailIf((array->fLevel & (RAID_LEVEL_1 | RAID_LEVEL_5 | RAID_LEVEL_6)) == 0, attempted,
               "a " + LevelText(array->fLevel) + " does not grow");
        BusyIf(array->fRebuilding, attempted, "it is being rebuilt", "tavoctl raid wait waits for the end");
        FailIf(array->nStatus != RAID_STATUS_NORMAL, attempted, std::string("it is ") + StatusText(array->nStatus),
               "tavoctl raid replace gives it a new disk");
        const std::vector<std::string> paths = DevicePaths(*words);
        paths.empty() ? GrowMembers(call, *array, attempted) : GrowSlots(call, *array, paths, attempted);
        if (*wait && !call.dry_run)
            WaitForArray(name, 0);
    };
}

Action RaidMigrate(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto member = in.Text("MEMBER", device_kind, member_help);
    return [=](Call &call) {
        const Array array = ReadArray(ArrayPath(*word));
        const std::string attempted = std::string("turn ") + array->szPath + " into a RAID 6";
        FailIf(array->fLevel != RAID_LEVEL_5, attempted, "it is a " + LevelText(array->fLevel));
        const std::vector<std::string> paths = {DevicePath(*member)};
        RefuseUsed(paths, attempted);
        call.Change(array->szPath, "level", LevelText(array->fLevel), LevelText(RAID_LEVEL_6));
        call.Change(array->szPath, "members", {}, paths);
        if (!call.Proceed(LossOf(paths)))
            return;
        const StringList members(paths);
        Must(RAIDMigrate2RAID6(array.get(), members.Get()) == 0, attempted, log_hint);
    };
}

Action RaidHalt(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    return [=](Call &call) {
        const Array array = ReadArray(ArrayPath(*word));
        const std::string attempted = std::string("stop ") + array->szPath;
        RefuseUsedArray(array->szPath, attempted);
        call.Change(array->szPath, "status", StatusText(array->nStatus), "stopped");
        if (call.Proceed(std::string("Stop ") + array->szPath + "?"))
            Must(RAIDStop(array->szPath) == 0, attempted, log_hint);
    };
}

Action RaidErase(Arguments &in)
{
    const auto words = in.Texts("MEMBER", device_kind, member_help, 0);
    const auto uuid = in.Option("--uuid", "UUID", any_text, "of an array that does not run");
    return [=](Call &call) {
        RefuseIf(words->empty() == !*uuid, "erase superblocks", "name members, or use --uuid");
        if (*uuid) {
            const std::string attempted = "erase the superblocks of array " + **uuid;
            for (const Array &array : ReadArrays()) {
                char found[64];
                BusyIf(RAIDUUIDGet(array->szPath, found, sizeof found) == 1 && **uuid == found, attempted,
                       std::string(array->szPath) + " runs", "stop it first");
            }
            call.Change("the members of " + **uuid, "superblock", **uuid, {});
            if (call.Proceed("Erase all superblocks of array " + **uuid + "?"))
                Must(RAIDSBCleanByUUID(nullptr, (*uuid)->c_str()) == 0, attempted, log_hint);
            return;
        }
        const std::vector<std::string> paths = DevicePaths(*words);
        const std::string what = "the superblocks of " + Joined(paths, ", ");
        RefuseUsed(paths, "erase " + what);
        for (const std::string &path : paths)
            call.Change(path, "superblock", "present or not", {});
        if (!call.Proceed("Erase " + what + "?"))
            return;
        for (const std::string &path : paths)
            Must(RAIDSBClean(path.c_str()) == 0, "erase the superblock of " + path, log_hint);
    };
}

}  // namespace tavoctl
