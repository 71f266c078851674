// tavoctl raid: the arrays and the superblocks of their members.
#include "families.h"
#include "frame/containers.h"
#include "frame/files.h"
#include "storage/arrays.h"
#include "storage/device.h"
#include "storage/raid_verbs.h"
#include "storage/stopped_arrays.h"

#include <algorithm>
#include <cstdlib>
#include <sstream>

namespace tavoctl {
namespace {

// An array as the kernel has it, or as its members have it when it does not run; whether its disks may be woken for the
// rest.
struct ArrayFacts {
    std::shared_ptr<const RAIDINFO> info;
    bool wake;
    std::optional<std::string> uuid;  // where it is known
};

std::optional<std::string> UuidOf(const ArrayFacts &array)
{
    if (array.uuid)
        return array.uuid;
    const std::vector<std::string> members = Members(*array.info, ~0);
    const bool reads_all = std::all_of(members.begin(), members.end(),
                                       [&](const std::string &path) { return array.wake || !Sleeps(path); });
    char uuid[64];
    if (!reads_all || RAIDUUIDGet(array.info->szPath, uuid, sizeof uuid) != 1)
        return {};
    return uuid;
}

// The number that a file of the kernel's about an array begins with: "200000 (system)".
std::optional<int64_t> SettingOf(const ArrayFacts &array, const char *name)
{
    std::istringstream text(KernelText(ArrayFile(array.info->szPath, name)).value_or(""));
    int64_t number = 0;
    return text >> number ? std::optional(number) : std::nullopt;
}

template <int states>
constexpr auto members_in = [](const ArrayFacts &a) { return Members(*a.info, states); };

constexpr Column<ArrayFacts> array_columns[] = {
    {"array", [](const ArrayFacts &a) { return DeviceName(a.info->szPath); }},
    {"path", [](const ArrayFacts &a) { return std::string(a.info->szPath); }, "", in_details},
    {"level", [](const ArrayFacts &a) { return LevelText(a.info->fLevel); }},
    {"status", [](const ArrayFacts &a) -> std::string { return StatusText(a.info->nStatus); },
     "normal, degraded or crashed; stopped: it does not run"},
    {"size",
     [](const ArrayFacts &a) { return a.info->cbArray ? std::optional(Bytes{a.info->cbArray}) : std::nullopt; }},
    {"member_size",
     [](const ArrayFacts &a) { return a.info->cbMember ? std::optional(Bytes{a.info->cbMember}) : std::nullopt; },
     "what is used of each member", in_details},
    {"stripe_size",
     [](const ArrayFacts &a) {
         const int kib = RAIDMdStripeSizeGet(a.info->szPath);
         return kib > 0 ? std::optional(Bytes{static_cast<uint64_t>(kib) * 1024}) : std::nullopt;
     },
     "", in_details},
    {"slots", [](const ArrayFacts &a) { return a.info->nSlot; }},
    {"working", [](const ArrayFacts &a) { return a.info->nWorking; }},
    {"failures", [](const ArrayFacts &a) { return a.info->nFailed; }, "how many members have failed"},
    {"members", [](const ArrayFacts &a) { return Mapped(Members(*a.info, ~0), DeviceName); }},
    {"active", members_in<RAID_MEMBER_ACTIVE>, "paths of members in sync", in_details},
    {"spare", members_in<RAID_MEMBER_SPARE>, "paths of spares, and of members that are being rebuilt", in_details},
    {"failed", members_in<RAID_MEMBER_FAILED>, "paths", in_details},
    {"fatal", members_in<RAID_MEMBER_FATAL>, "paths of members that failed, and the array with them", in_details},
    {"action", [](const ArrayFacts &a) { return Maybe(ActionOf(*a.info)); }, "recover, resync, reshape, check"},
    {"percent",
     [](const ArrayFacts &a) {
         const auto rebuild = RebuildOf(*a.info);
         return rebuild ? std::optional(rebuild->Percent()) : std::nullopt;
     },
     "of the action"},
    {"seconds_left",
     [](const ArrayFacts &a) {
         const auto rebuild = RebuildOf(*a.info);
         return rebuild && rebuild->speed
                    ? std::optional((rebuild->total - std::min(rebuild->done, rebuild->total)) / 2 / rebuild->speed)
                    : std::nullopt;
     },
     "", in_details},
    {"mismatches", [](const ArrayFacts &a) { return SettingOf(a, "mismatch_cnt"); },
     "sectors that the last scrub found not to match", in_details},
    {"least_speed", [](const ArrayFacts &a) { return SettingOf(a, "sync_speed_min"); },
     "that a rebuild keeps up beside other work", in_details, "KiB a second"},
    {"most_speed", [](const ArrayFacts &a) { return SettingOf(a, "sync_speed_max"); }, "of a rebuild", in_details,
     "KiB a second"},
    {"uuid", [](const ArrayFacts &a) { return UuidOf(a); }, "", in_one},
    {"use", [](const ArrayFacts &a) { return Maybe(UseOf(a.info->szPath)); }, "why it must not be stopped", in_one},
};

constexpr Column<RAIDSBENTRY> superblock_columns[] = {
    {"member", [](const RAIDSBENTRY &e) { return DeviceName(e.szMember); }},
    {"array", [](const RAIDSBENTRY &e) { return Maybe(DeviceName(e.superblock.szArray)); }},
    {"level", [](const RAIDSBENTRY &e) { return LevelText(e.superblock.fLevel); }},
    {"members", [](const RAIDSBENTRY &e) { return e.superblock.nMember; }, "how many"},
    {"slot", [](const RAIDSBENTRY &e) { return e.superblock.iRole; }, "-1: a spare"},
    {"version",
     [](const RAIDSBENTRY &e) {
         return std::to_string(e.superblock.nMajor) + "." + std::to_string(e.superblock.nMinor);
     }},
    {"events", [](const RAIDSBENTRY &e) { return e.superblock.nEvent; }},
    {"uuid", [](const RAIDSBENTRY &e) { return std::string(e.superblock.szUuid); }},
};

Action RaidList(Arguments &in)
{
    const auto all = in.Flag("--all", "also those that do not run; this reads every disk");
    const auto wake = in.Flag("--wake", "with --all: read the disks although that wakes them");
    return [=](Call &call) {
        std::vector<ArrayFacts> arrays;
        for (Array &array : ReadArrays())
            arrays.push_back({std::move(array), *wake, {}});
        if (*all)
            for (const StoppedArray &array : StoppedArrays(*wake))
                arrays.push_back({array.Record(), *wake, array.uuid});
        call.List(array_columns, arrays);
    };
}

Action RaidInfo(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto wake = in.Flag("--wake", "read the UUID although that wakes a disk");
    return [=](Call &call) { call.One(array_columns, ArrayFacts{ReadArray(ArrayPath(*word)), *wake, {}}); };
}

Action RaidSuperblock(Arguments &in)
{
    const auto words = in.Texts("MEMBER", device_kind, member_help);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) {
        const std::string attempted = "read superblocks";
        StringList paths;
        for (const std::string &path : DevicePaths(*words)) {
            FailIf(!*wake && Sleeps(path), "read the superblock of " + path, "its disk is in standby",
                   "--wake reads it anyway");
            paths.Push(path);
        }
        RAIDSBENTRY *entries = nullptr;
        const int count = RAIDSBEnum(paths.Get(), &entries);
        Must(count >= 0, attempted);
        const std::unique_ptr<RAIDSBENTRY, void (*)(void *)> owner(entries, std::free);
        FailIf(count == 0, attempted, "there is none", {}, exit_not_found);
        call.List(superblock_columns, std::vector<RAIDSBENTRY>(entries, entries + count));
    };
}

}  // namespace

void AddRaid(Program &program)
{
    Family &raid = program.Add("raid", "Arrays of disks");
    raid.Add("list", reads, Answer::List(array_columns), RaidList,
             R"(Lists the arrays that run: their health, and how far a
rebuild has come, in percent. No disk is read. --all also lists those that do not run, from what their members say.

tavoctl raid list
tavoctl raid list --all --output array,status,members,uuid)");
    raid.Add("info", reads, Answer::One(array_columns), RaidInfo,
             R"(Shows what is known of an array. A member is active (in
sync), spare (or being rebuilt), failed, or fatal: failed, and the array with it.

tavoctl raid info md2
tavoctl raid info --json md2)");
    raid.Add("create", changes | destroys, RaidCreate, R"(Makes an array of MEMBERs. What is on them is lost; one
that is in use is refused. Slots without a member are left missing, so that an array can be made degraded. Spares are
the last members.

tavoctl raid create --level 5 md2 sda3 sdb3 sdc3
tavoctl raid create --yes --level 5 --slots 4 md2 sda3 sdb3 sdc3
tavoctl raid create --level 1 --no-sync md0 sda1 sdb1)");
    raid.Add("add", changes | destroys, RaidAdd, R"(Adds members to an array. A degraded one is rebuilt onto the
first, the others are spares; a linear one grows. What is on them is lost; one that is in use or too small is refused.

tavoctl raid add md2 sdd3
tavoctl raid add --yes md2 sdd3)");
    raid.Add("remove", changes | destroys, RaidTakeOut, R"(Removes failed and spare members from an array. Without
MEMBER the whole array is removed: it is stopped and the superblocks of its members are erased, so that it cannot be
started again. An array that is in use is refused.

tavoctl raid remove md2 sdd3
tavoctl raid remove md3)");
    raid.Add("grow", changes | destroys, RaidGrow, R"(Makes an array in order larger: by new MEMBERs, over which
its data is spread in the background, or without MEMBER to all the room that its members have, after each of them was
replaced by a larger one. What is on new members is lost; one that is in use or too small is refused, and so is a RAID 5
or 6 with so little room before its data that a power failure meanwhile could damage it. Then `volume grow` has the volume
on it use the room.

tavoctl raid grow --wait md2 sde3
tavoctl raid grow md2)");
    raid.Add("migrate", changes | destroys, RaidMigrate, R"(Turns a RAID 5 into a RAID 6 with a new member, which is
rebuilt onto in the background. What is on it is lost. `raid grow` adds others afterwards.

tavoctl raid migrate md2 sde3)");
    raid.Add("stop", changes | destroys, RaidHalt, R"(Stops an array; its members keep their superblocks, so
`raid assemble` starts it again. One in use is refused.

tavoctl raid stop md2)");
    raid.Add("assemble", changes | destroys, RaidStart, R"(Starts an array from the members that carry its UUID; without
UUID, the one that its members call ARRAY. --all starts all that do not run, says why one is not started, and ends with
status 1 then. What is started this way is in order, or degraded and known to be whole. --force also starts an array
whose members disagree after a power failure: it shows how far each member has come and what may be lost, and asks.

tavoctl raid assemble --all
tavoctl raid assemble md2
tavoctl raid assemble md2 495e879a:4e806313:a484c744:9c844bd2
tavoctl raid assemble --force md2)");
    raid.Add("replace", changes | destroys, RaidReplace, R"(Puts a new disk into the place of a member. The last DISK
is the new one; before it stands the member that goes, which may be left out when only one has failed or was pulled. The
new disk gets the partitions that the other members' disks have, and the array is rebuilt onto it; what was on it is
lost. A disk that serves several arrays is replaced in each. One that is in use or too small is refused.

tavoctl raid replace md2 sdd
tavoctl raid replace --yes --wait md2 sdb3 sdd)");
    raid.Add("scrub", changes, RaidScrub, R"(Compares the members of an array with each other in the background.
Sectors that cannot be read are written again from the other members; how many do not match is shown by `raid info`,
and with --wait when it has ended.

tavoctl raid scrub md2
tavoctl raid scrub --wait md2
tavoctl raid scrub --stop md2)");
    raid.Add("speed", changes, RaidSpeed, R"(Sets how fast an array is rebuilt or scrubbed, until it is stopped.
The speed is that of each member.

tavoctl raid speed --least 20000 --most 100000 md2
tavoctl raid speed --most 0 md2)");
    raid.Add("erase", changes | destroys, RaidErase, R"(Erases the RAID superblocks of MEMBERs, or with --uuid
those of every disk and partition that belongs to that array. What is in use is refused.

tavoctl raid erase sdb3
tavoctl raid erase --uuid 495e879a:4e806313:a484c744:9c844bd2)");
    raid.Add("wait", reads, Answer::Nothing(), RaidWait,
             R"(Waits until arrays are no longer being rebuilt, one after the other,
and fails when one is not in order then. At a terminal it shows how far it is, the rate and the time left.

tavoctl raid wait md2
tavoctl raid wait --timeout 3600 md0 md2)");
    raid.Add("superblock", reads, Answer::List(superblock_columns), RaidSuperblock,
             R"(Shows the superblocks of members: which array each
belongs to, and as what.

tavoctl raid superblock sda3 sdb3)");
}

}  // namespace tavoctl
