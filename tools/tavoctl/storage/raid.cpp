// tavoctl raid: the arrays and the superblocks of their members.
#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/progress.h"
#include "storage/arrays.h"
#include "storage/device.h"
#include "storage/raid_verbs.h"

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <thread>

namespace tavoctl {
namespace {

// An array as the kernel has it; whether its disks may be woken for the rest.
struct ArrayFacts {
    std::shared_ptr<const RAIDINFO> info;
    bool wake;
};

// Whether the disk of a member is in standby.
bool Sleeps(const std::string &member)
{
    const std::string disk = member.substr(0, member.find_last_not_of("0123456789") + 1);
    return disk.starts_with("/dev/sd") && PowerOf(disk) == Power::standby;
}

std::optional<std::string> UuidOf(const ArrayFacts &array)
{
    const std::vector<std::string> members = Members(*array.info, ~0);
    const bool reads_all = std::all_of(members.begin(), members.end(),
                                       [&](const std::string &path) { return array.wake || !Sleeps(path); });
    char uuid[64];
    if (!reads_all || RAIDUUIDGet(array.info->szPath, uuid, sizeof uuid) != 1)
        return {};
    return uuid;
}

template <int states>
constexpr auto members_in = [](const ArrayFacts &a) {
    return Members(*a.info, states);
};

constexpr Column<ArrayFacts> array_columns[] = {
    {"array",
     [](const ArrayFacts &a) {
         return DeviceName(a.info->szPath);
     }},
    {"path", [](const ArrayFacts &a) { return std::string(a.info->szPath); }, "", in_details},
    {"level",
     [](const ArrayFacts &a) {
         return LevelText(a.info->fLevel);
     }},
    {"status", [](const ArrayFacts &a) -> std::string { return StatusText(a.info->nStatus); },
     "normal, degraded or crashed"},
    {"size",
     [](const ArrayFacts &a) {
         return Bytes{a.info->cbArray};
     }},
    {"member_size",
     [](const ArrayFacts &a) { return a.info->cbMember ? std::optional(Bytes{a.info->cbMember}) : std::nullopt; },
     "what is used of each member", in_details},
    {"stripe_size",
     [](const ArrayFacts &a) {
         const int kib = RAIDMdStripeSizeGet(a.info->szPath);
         return kib > 0 ? std::optional(Bytes{static_cast<uint64_t>(kib) * 1024}) : std::nullopt;
     },
     "", in_details},
    {"slots",
     [](const ArrayFacts &a) {
         return a.info->nSlot;
     }},
    {"working",
     [](const ArrayFacts &a) {
         return a.info->nWorking;
     }},
    {"failures", [](const ArrayFacts &a) { return a.info->nFailed; }, "how many members have failed"},
    {"members",
     [](const ArrayFacts &a) {
         std::vector<std::string> names;
         for (const std::string &path : Members(*a.info, ~0))
             names.push_back(DeviceName(path));
         return names;
     }},
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
    {"uuid", [](const ArrayFacts &a) { return UuidOf(a); }, "", in_one},
    {"use", [](const ArrayFacts &a) { return Maybe(UseOf(a.info->szPath)); }, "why it must not be stopped", in_one},
};

constexpr Column<RAIDSBENTRY> superblock_columns[] = {
    {"member",
     [](const RAIDSBENTRY &e) {
         return DeviceName(e.szMember);
     }},
    {"array",
     [](const RAIDSBENTRY &e) {
         return Maybe(DeviceName(e.superblock.szArray));
     }},
    {"level",
     [](const RAIDSBENTRY &e) {
         return LevelText(e.superblock.fLevel);
     }},
    {"members", [](const RAIDSBENTRY &e) { return e.superblock.nMember; }, "how many"},
    {"slot", [](const RAIDSBENTRY &e) { return e.superblock.iRole; }, "-1: a spare"},
    {"version",
     [](const RAIDSBENTRY &e) {
         return std::to_string(e.superblock.nMajor) + "." + std::to_string(e.superblock.nMinor);
     }},
    {"events",
     [](const RAIDSBENTRY &e) {
         return e.superblock.nEvent;
     }},
    {"uuid",
     [](const RAIDSBENTRY &e) {
         return std::string(e.superblock.szUuid);
     }},
};

Action RaidList(Arguments &)
{
    return [](Call &call) {
        std::vector<ArrayFacts> arrays;
        for (Array &array : ReadArrays())
            arrays.push_back({std::move(array), false});
        call.List(array_columns, arrays);
    };
}

Action RaidInfo(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto wake = in.Flag("--wake", "read the UUID although that wakes a disk");
    return [=](Call &call) {
        call.One(array_columns, ArrayFacts{ReadArray(ArrayPath(*word)), *wake});
    };
}

using Clock = std::chrono::steady_clock;

// Until the array is not rebuilt any more; a time limit of 0 seconds is none.
void WaitFor(const std::string &path, Clock::time_point start, int64_t timeout)
{
    constexpr int most_quiet = 10;
    const std::string attempted = "wait for " + path;
    Progress progress(DeviceName(path));
    int quiet = 0;  // rounds in which nothing went on
    for (;; std::this_thread::sleep_for(std::chrono::seconds(1))) {
        const Array array = ReadArray(path);
        const bool busy = array->fRebuilding != 0;
        quiet = busy ? 0 : quiet + 1;
        if (!busy && array->nStatus == RAID_STATUS_NORMAL)
            return;
        // A spare that has just come is rebuilt onto after a moment.
        const bool begins = array->nStatus == RAID_STATUS_DEGRADED && !Members(*array, RAID_MEMBER_SPARE).empty();
        if (!busy && !(begins && quiet < most_quiet))
            throw Failure{.attempted = attempted, .reason = std::string("it is ") + StatusText(array->nStatus)};
        if (timeout > 0 && Clock::now() - start >= std::chrono::seconds(timeout))
            throw BusyFailure(attempted, "the time is up");
        const auto rebuild = RebuildOf(*array);
        progress.Show(ActionOf(*array) + " " + (rebuild ? rebuild->Text() : "begins"));
    }
}

Action RaidWait(Arguments &in)
{
    const auto words = in.Texts("ARRAY", array_kind, array_help);
    const auto timeout = in.Number("--timeout", "SECONDS", "give up after so long; 0: never (0)");
    return [=](Call &) {
        const Clock::time_point start = Clock::now();
        for (const std::string &word : *words)
            WaitFor(ArrayPath(word), start, timeout->value_or(0));
    };
}

Action RaidSuperblock(Arguments &in)
{
    const auto words = in.Texts("MEMBER", device_kind, member_help);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) {
        const std::string attempted = "read superblocks";
        StringList paths;
        for (const std::string &path : DevicePaths(*words)) {
            if (!*wake && Sleeps(path))
                throw Failure{.attempted = "read the superblock of " + path,
                              .reason = "its disk is in standby",
                              .hint = "say --wake to read it nevertheless"};
            paths.Push(path);
        }
        RAIDSBENTRY *entries = nullptr;
        const int count = RAIDSBEnum(paths.Get(), &entries);
        Must(count >= 0, attempted);
        const std::unique_ptr<RAIDSBENTRY, void (*)(void *)> owner(entries, std::free);
        if (count == 0)
            throw Failure{.attempted = attempted, .reason = "there is none", .status = exit_not_found};
        call.List(superblock_columns, std::vector<RAIDSBENTRY>(entries, entries + count));
    };
}

}  // namespace

void AddRaid(Program &program)
{
    Family &raid = program.Add("raid", "Arrays of disks");
    raid.Add("list", reads, Answer::List(array_columns), R"(Lists the arrays that run: their health, and how far a
rebuild has come, in percent. No disk is read.

tavoctl raid list)",
             RaidList);
    raid.Add("info", reads, Answer::One(array_columns), R"(Shows what is known of an array. A member is active (in
sync), spare (or being rebuilt), failed, or fatal: failed, and the array with it.

tavoctl raid info md2
tavoctl raid info --json md2)",
             RaidInfo);
    raid.Add("create", changes | destroys, Answer::Change(), R"(Makes an array of MEMBERs. What is on them is lost; one
that is in use is refused. Slots without a member are left missing, so that an array can be made degraded. Spares are
the last members.

tavoctl raid create --level 5 md2 sda3 sdb3 sdc3
tavoctl raid create --yes --level 5 --slots 4 md2 sda3 sdb3 sdc3
tavoctl raid create --level 1 --no-sync md0 sda1 sdb1)",
             RaidCreate);
    raid.Add("add", changes | destroys, Answer::Change(),
             R"(Adds members to an array. A degraded one is rebuilt onto the
first, the others are spares; a linear one grows. What is on them is lost; one that is in use or too small is refused.

tavoctl raid add md2 sdd3
tavoctl raid add --yes md2 sdd3)",
             RaidAdd);
    raid.Add("remove", changes | destroys, Answer::Change(), R"(Removes failed and spare members from an array. Without
MEMBER the whole array is removed: it is stopped and the superblocks of its members are erased, so that it cannot be
started again. An array that is in use is refused.

tavoctl raid remove md2 sdd3
tavoctl raid remove md3)",
             RaidTakeOut);
    raid.Add("migrate", changes | destroys, Answer::Change(),
             R"(Turns a RAID 5 into a RAID 6 with a new member, which is
rebuilt onto in the background. With more new members the array must have as many slots as there are new members, minus
1; usually one is right. What is on them is lost.

tavoctl raid migrate md2 sde3)",
             RaidMigrate);
    raid.Add("stop", changes | destroys, Answer::Change(), R"(Stops an array; its members keep their superblocks, so
`raid assemble` starts it again. One in use is refused.

tavoctl raid stop md2)",
             RaidHalt);
    raid.Add("assemble", changes, Answer::Change(), R"(Starts an array from the members that carry its UUID, as `raid
superblock` shows it.

tavoctl raid assemble md2 495e879a:4e806313:a484c744:9c844bd2)",
             RaidStart);
    raid.Add("erase", changes | destroys, Answer::Change(), R"(Erases the RAID superblocks of MEMBERs, or with --uuid
those of every disk and partition that belongs to that array. What is in use is refused.

tavoctl raid erase sdb3
tavoctl raid erase --uuid 495e879a:4e806313:a484c744:9c844bd2)",
             RaidErase);
    raid.Add("wait", reads, Answer::Nothing(), R"(Waits until arrays are no longer being rebuilt, one after the other,
and fails when one is not in order then. At a terminal it shows how far it is, the rate and the time left.

tavoctl raid wait md2
tavoctl raid wait --timeout 3600 md0 md2)",
             RaidWait);
    raid.Add("superblock", reads, Answer::List(superblock_columns),
             R"(Shows the superblocks of members: which array each
belongs to, and as what.

tavoctl raid superblock sda3 sdb3)",
             RaidSuperblock);
}

}  // namespace tavoctl
