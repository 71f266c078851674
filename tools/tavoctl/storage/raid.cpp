// tavoctl raid: the arrays and the superblocks of their members.
#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/progress.h"
#include "frame/table.h"
#include "storage/arrays.h"
#include "storage/device.h"
#include "storage/raid_change.h"

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <thread>

namespace tavoctl {
namespace {

Cell PercentCell(const RAIDINFO &info)
{
    const auto rebuild = RebuildOf(info);
    return rebuild ? Cell(rebuild->Percent()) : Cell();
}

// Whether the disk of a member is in standby.
bool Sleeps(const std::string &member)
{
    const std::string disk = member.substr(0, member.find_last_not_of("0123456789") + 1);
    return disk.starts_with("/dev/sd") && PowerOf(disk) == Power::standby;
}

class RaidList : public Verb {
  public:
    static constexpr VerbInfo info = {"list", reads,
                                      "Lists the arrays that run: their health, and how far a rebuild has come, in "
                                      "percent. No disk is read.",
                                      "tavoctl raid list"};

    int Run(const Call &call) override
    {
        Table table({"array", "level", "status", "size", "slots", "working", "failed", "action", "percent", "members"});
        for (const Array &array : ReadArrays()) {
            std::vector<std::string> members;
            for (const std::string &path : Members(*array, ~0))
                members.push_back(DeviceName(path));
            table.Add({DeviceName(array->szPath), LevelText(array->fLevel), StatusText(array->nStatus),
                       Bytes{array->cbArray}, int{array->nSlot}, int{array->nWorking}, int{array->nFailed},
                       Known(ActionOf(*array)), PercentCell(*array), members});
        }
        call.Print(table);
        return exit_done;
    }
};

class RaidInfo : public Verb {
  public:
    static constexpr VerbInfo info = {"info", reads,
                                      "Shows what is known of an array. A member is active (in sync), spare (or being "
                                      "rebuilt), failed, or fatal: failed, and the array with it.",
                                      "tavoctl raid info md2\n"
                                      "tavoctl raid info --json md2"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("ARRAY", array_, "its name, md2 or /dev/md2", ArrayNames);
        arguments.Flag("--wake", wake_, "read the UUID although that wakes a disk");
    }

    int Run(const Call &call) override
    {
        const Array array = ReadArray(ArrayPath(array_));
        const int stripe = RAIDMdStripeSizeGet(array->szPath);
        const auto rebuild = RebuildOf(*array);
        Record record;
        record.Add("array", std::string(array->szPath));
        record.Add("level", LevelText(array->fLevel));
        record.Add("status", StatusText(array->nStatus));
        record.Add("size", Bytes{array->cbArray});
        record.Add("member_size", array->cbMember ? Cell(Bytes{array->cbMember}) : Cell());
        record.Add("stripe_size", stripe > 0 ? Cell(Bytes{static_cast<uint64_t>(stripe) * 1024}) : Cell());
        record.Add("slots", int{array->nSlot});
        record.Add("active", Members(*array, RAID_MEMBER_ACTIVE));
        record.Add("spare", Members(*array, RAID_MEMBER_SPARE));
        record.Add("failed", Members(*array, RAID_MEMBER_FAILED));
        record.Add("fatal", Members(*array, RAID_MEMBER_FATAL));
        record.Add("action", Known(ActionOf(*array)));
        record.Add("percent", PercentCell(*array));
        record.Add("seconds_left",
                   rebuild && rebuild->speed
                       ? Cell(static_cast<int64_t>((rebuild->total - rebuild->done) / 2 / rebuild->speed))
                       : Cell());
        record.Add("uuid", Uuid(*array));
        record.Add("use", Known(UseOf(array->szPath)));
        call.Print(record);
        return exit_done;
    }

  private:
    Cell Uuid(const RAIDINFO &array) const
    {
        const std::vector<std::string> members = Members(array, ~0);
        const bool reads_all = std::all_of(members.begin(), members.end(),
                                           [&](const std::string &path) { return wake_ || !Sleeps(path); });
        char uuid[64];
        return reads_all && RAIDUUIDGet(array.szPath, uuid, sizeof uuid) == 1 ? Cell(uuid) : Cell();
    }

    std::string array_;
    bool wake_ = false;
};

class RaidWait : public Verb {
  public:
    static constexpr VerbInfo info = {"wait", reads,
                                      "Waits until arrays are no longer being rebuilt, one after the other, and fails "
                                      "when one is not in order then. At a "
                                      "terminal it shows how far it is, the rate and the time left.",
                                      "tavoctl raid wait md2\n"
                                      "tavoctl raid wait --timeout 3600 md0 md2"};

    void Declare(Arguments &arguments) override
    {
        arguments.Texts("ARRAY", arrays_, "its name, md2 or /dev/md2", 1, ArrayNames);
        arguments.Number("--timeout", "SECONDS", timeout_, "give up after so long; 0: never (0)");
    }

    int Run(const Call &) override
    {
        std::vector<std::string> paths;
        for (const std::string &word : arrays_)
            paths.push_back(ArrayPath(word));
        for (const std::string &path : paths)
            WaitFor(path);
        return exit_done;
    }

  private:
    using Clock = std::chrono::steady_clock;

    void WaitFor(const std::string &path) const
    {
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
            if (timeout_ > 0 && Clock::now() - start_ >= std::chrono::seconds(timeout_))
                throw Failure{.attempted = attempted, .reason = "the time is up", .status = exit_busy};
            const auto rebuild = RebuildOf(*array);
            progress.Show(ActionOf(*array) + " " + (rebuild ? rebuild->Text() : "begins"));
        }
    }

    static constexpr int most_quiet = 10;

    std::vector<std::string> arrays_;
    int timeout_ = 0;
    Clock::time_point start_ = Clock::now();
};

class RaidSuperblock : public Verb {
  public:
    static constexpr VerbInfo info = {
        "superblock", reads,
        "Shows the superblocks of members: which array each belongs to, and as what. A slot "
        "of -1 is a spare.",
        "tavoctl raid superblock sda3 sdb3"};

    void Declare(Arguments &arguments) override
    {
        arguments.Texts("MEMBER", members_, "a partition or disk, sda3 or /dev/sda3", 1, DeviceNames);
        arguments.Flag("--wake", wake_, "read it although that wakes a disk");
    }

    int Run(const Call &call) override
    {
        StringList paths;
        for (const std::string &word : members_) {
            const std::string path = DevicePath(word);
            if (!wake_ && Sleeps(path))
                throw Failure{.attempted = "read the superblock of " + path,
                              .reason = "its disk is in standby",
                              .hint = "say --wake to read it all the same"};
            paths.Push(path);
        }
        RAIDSBENTRY *entries = nullptr;
        const int count = RAIDSBEnum(paths.Get(), &entries);
        if (count < 0)
            throw LibraryFailure("read superblocks");
        const std::unique_ptr<RAIDSBENTRY, void (*)(void *)> owner(entries, std::free);
        if (count == 0)
            throw Failure{.attempted = "read superblocks", .reason = "there is none", .status = exit_not_found};
        Table table({"member", "array", "level", "members", "slot", "version", "events", "uuid"});
        for (int i = 0; i < count; ++i) {
            const RAIDSUPERBLOCK &found = entries[i].superblock;
            table.Add({DeviceName(entries[i].szMember), Known(DeviceName(found.szArray)), LevelText(found.fLevel),
                       int{found.nMember}, int{found.iRole},
                       std::to_string(found.nMajor) + "." + std::to_string(found.nMinor), int{found.nEvent},
                       std::string(found.szUuid)});
        }
        call.Print(table);
        return exit_done;
    }

  private:
    std::vector<std::string> members_;
    bool wake_ = false;
};

}  // namespace

void AddRaid(Program &program)
{
    Family &raid = program.Add("raid", "Arrays of disks");
    raid.Add<RaidList>();
    raid.Add<RaidInfo>();
    AddRaidChange(raid);
    raid.Add<RaidWait>();
    raid.Add<RaidSuperblock>();
}

}  // namespace tavoctl
