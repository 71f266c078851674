// tavoctl raid: making, mending and stopping arrays.
#include "storage/raid_change.h"

#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "storage/arrays.h"
#include "storage/device.h"

#include <algorithm>

namespace tavoctl {
namespace {

constexpr char array_help[] = "its name, md2 or /dev/md2";
constexpr char member_help[] = "a partition or disk, sda3 or /dev/sda3";

bool Runs(const std::string &path)
{
    RAIDINFO *info = nullptr;
    const bool runs = RAIDInfoGet(path.c_str(), &info) == 1;
    RAIDInfoFree(info);
    return runs;
}

// What is on the devices is going to be lost.
void ConfirmLoss(const Call &call, const std::vector<std::string> &paths, const std::string &attempted)
{
    RefuseUsed(paths, attempted);
    call.Confirm("Lose what is on " + Listed(paths) + "?");
}

void RefuseUsedArray(const std::string &path, const std::string &attempted)
{
    if (const std::string use = UseOf(path); !use.empty())
        throw Failure{.attempted = attempted, .reason = use, .hint = "free it first", .status = exit_busy};
}

class RaidCreate : public Verb {
  public:
    static constexpr VerbInfo info = {"create", changes | destroys,
                                      "Makes an array of MEMBERs. What is on them is lost; one that is in use is "
                                      "refused. Slots without a member are left "
                                      "missing, so that an array can be made degraded. Spares are the last members.",
                                      "tavoctl raid create --level 5 md2 sda3 sdb3 sdc3\n"
                                      "tavoctl raid create --yes --level 5 --slots 4 md2 sda3 sdb3 sdc3\n"
                                      "tavoctl raid create --level 1 --no-sync md0 sda1 sdb1"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("ARRAY", array_, array_help);
        arguments.Texts("MEMBER", words_, member_help, 1, DeviceNames);
        arguments.Option("--level", "LEVEL", level_, "0, 1, 5, 6, 10 or linear",
                         [] { return std::vector<std::string>{"0", "1", "5", "6", "10", "linear"}; });
        arguments.Number("--slots", "SLOTS", slots_, "members that it is made for, without spares", 1);
        arguments.Number("--spares", "SPARES", spares_, "how many of the members are spares (0)");
        arguments.Number("--size", "MIB", mib_, "what is used of each member; 0: all (0)");
        arguments.Flag("--no-sync", no_sync_, "take the members as being in sync: for new disks that are all zero");
    }

    int Run(const Call &call) override
    {
        const std::string path = ArrayPath(array_);
        const std::string attempted = "make the array " + path;
        const auto level = LevelOf(level_);
        if (!level)
            throw UsageFailure(attempted, level_.empty() ? "say --level" : "there is no level " + level_,
                               "0, 1, 5, 6, 10 or linear");
        const std::vector<std::string> paths = DevicePaths(words_);
        RefuseTwice(paths, attempted);
        if (Runs(path))
            throw Failure{.attempted = attempted, .reason = "it runs", .hint = "stop it first", .status = exit_busy};
        ConfirmLoss(call, paths, attempted);
        const StringList members(paths);
        const int active = static_cast<int>(paths.size()) - spares_;
        const RAIDREQUEST request = {.szPath = path.c_str(),
                                     .pVersion = nullptr,
                                     .fLevel = *level,
                                     .nSpare = spares_,
                                     .nSlot = slots_ ? slots_ : std::max(active, 1),
                                     .cbArray = static_cast<uint64_t>(mib_) << 20,
                                     .pslMembers = members.Get(),
                                     .fSync = no_sync_ ? 0 : 1};
        if (RAIDCreate(&request) != 0)
            throw LibraryFailure(attempted, log_hint);
        return exit_done;
    }

  private:
    static void RefuseTwice(std::vector<std::string> paths, const std::string &attempted)
    {
        std::sort(paths.begin(), paths.end());
        const auto twice = std::adjacent_find(paths.begin(), paths.end());
        if (twice != paths.end())
            throw UsageFailure(attempted, *twice + " is named twice");
    }

    std::string array_;
    std::vector<std::string> words_;
    std::string level_;
    int slots_ = 0;
    int spares_ = 0;
    int mib_ = 0;
    bool no_sync_ = false;
};

// A verb about an array that runs and members of it.
template <int AtLeast>
class MembersVerb : public Verb {
  public:
    void Declare(Arguments &arguments) override
    {
        arguments.Text("ARRAY", array_, array_help, ArrayNames);
        arguments.Texts("MEMBER", words_, member_help, AtLeast, DeviceNames);
    }

  protected:
    std::string array_;
    std::vector<std::string> words_;
};

class RaidAdd : public MembersVerb<1> {
  public:
    static constexpr VerbInfo info = {"add", changes | destroys,
                                      "Adds members to an array: a degraded one is rebuilt onto the first, the others "
                                      "are spares; a linear one grows. What "
                                      "is on them is lost; one that is in use or too small is refused.",
                                      "tavoctl raid add md2 sdd3\n"
                                      "tavoctl raid add --yes md2 sdd3"};

    int Run(const Call &call) override
    {
        const Array array = ReadArray(ArrayPath(array_));
        const std::vector<std::string> paths = DevicePaths(words_);
        const std::string attempted = "add " + Listed(paths) + " to " + array->szPath;
        if (array->fLevel == RAID_LEVEL_0)
            throw Failure{.attempted = attempted, .reason = "a RAID 0 takes no members"};
        ConfirmLoss(call, paths, attempted);
        for (const std::string &path : paths) {
            if (RAIDAddRobustCheck(array.get(), path.c_str()) != 0)
                throw LibraryFailure("add " + path + " to " + array->szPath,
                                     TLIBErrGet() == ERR_NOT_ENOUGH_SPACE ? "take a larger one" : log_hint);
        }
        return exit_done;
    }
};

class RaidRemove : public MembersVerb<0> {
  public:
    static constexpr VerbInfo info = {"remove", changes | destroys,
                                      "Removes failed and spare members from an array. Without MEMBER the whole array "
                                      "is removed: it is stopped and the "
                                      "superblocks of its members are erased, so that it cannot be started again. An "
                                      "array that is in use is refused.",
                                      "tavoctl raid remove md2 sdd3\n"
                                      "tavoctl raid remove md3"};

    int Run(const Call &call) override
    {
        const Array array = ReadArray(ArrayPath(array_));
        if (words_.empty())
            RemoveArray(call, *array);
        else
            RemoveMembers(call, *array);
        return exit_done;
    }

  private:
    static void RemoveArray(const Call &call, const RAIDINFO &array)
    {
        const std::string attempted = std::string("remove ") + array.szPath;
        RefuseUsedArray(array.szPath, attempted);
        call.Confirm(std::string("Lose the array ") + array.szPath + " and what is on it?");
        if (RAIDRemove(&array) != 0)
            throw LibraryFailure(attempted, log_hint);
    }

    void RemoveMembers(const Call &call, const RAIDINFO &array) const
    {
        const std::vector<std::string> paths = DevicePaths(words_);
        const std::string attempted = "remove " + Listed(paths) + " from " + array.szPath;
        const std::vector<std::string> active = Members(array, RAID_MEMBER_ACTIVE);
        const std::vector<std::string> all = Members(array, ~0);
        for (const std::string &path : paths) {
            if (std::find(active.begin(), active.end(), path) != active.end())
                throw Failure{.attempted = attempted, .reason = path + " is in sync", .status = exit_busy};
            if (std::find(all.begin(), all.end(), path) == all.end())
                throw NotFound(attempted, ERR_PATH_NOT_FOUND, path + " is no member");
        }
        call.Confirm("Remove " + Listed(paths) + " from " + array.szPath + "?");
        for (const std::string &path : paths) {
            if (RAIDRemoveDisk(&array, path.c_str()) != 0)
                throw LibraryFailure("remove " + path + " from " + array.szPath, log_hint);
        }
    }
};

class RaidMigrate : public MembersVerb<1> {
  public:
    static constexpr VerbInfo info = {"migrate", changes | destroys,
                                      "Turns a RAID 5 into a RAID 6 with a new member, which is rebuilt onto in the "
                                      "background. With more new members the "
                                      "array must have as many slots as there are new members, minus 1; usually one is "
                                      "right. What is on them is lost.",
                                      "tavoctl raid migrate md2 sde3"};

    int Run(const Call &call) override
    {
        const Array array = ReadArray(ArrayPath(array_));
        const std::string attempted = std::string("turn ") + array->szPath + " into a RAID 6";
        if (array->fLevel != RAID_LEVEL_5)
            throw Failure{.attempted = attempted, .reason = "it is a " + LevelText(array->fLevel)};
        const std::vector<std::string> paths = DevicePaths(words_);
        ConfirmLoss(call, paths, attempted);
        const StringList members(paths);
        if (RAIDMigrate2RAID6(array.get(), members.Get()) != 0)
            throw LibraryFailure(attempted, log_hint);
        return exit_done;
    }
};

class RaidStop : public Verb {
  public:
    static constexpr VerbInfo info = {"stop", changes | destroys,
                                      "Stops an array; its members keep their superblocks, so `raid assemble` starts "
                                      "it again. One in use is refused.",
                                      "tavoctl raid stop md2"};

    void Declare(Arguments &arguments) override { arguments.Text("ARRAY", array_, array_help, ArrayNames); }

    int Run(const Call &call) override
    {
        const Array array = ReadArray(ArrayPath(array_));
        const std::string attempted = std::string("stop ") + array->szPath;
        RefuseUsedArray(array->szPath, attempted);
        call.Confirm(std::string("Stop ") + array->szPath + "?");
        if (RAIDStop(array->szPath) != 0)
            throw LibraryFailure(attempted, log_hint);
        return exit_done;
    }

  private:
    std::string array_;
};

class RaidAssemble : public Verb {
  public:
    static constexpr VerbInfo info = {
        "assemble", changes, "Starts an array from the members that carry its UUID, as `raid superblock` shows it.",
        "tavoctl raid assemble md2 495e879a:4e806313:a484c744:9c844bd2"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("ARRAY", array_, array_help);
        arguments.Text("UUID", uuid_, "of the array");
    }

    int Run(const Call &) override
    {
        const std::string path = ArrayPath(array_);
        if (RAIDAssemble(path.c_str(), uuid_.c_str()) != 0)
            throw LibraryFailure("start " + path, TLIBErrGet() ? "" : log_hint);
        return exit_done;
    }

  private:
    std::string array_;
    std::string uuid_;
};

class RaidErase : public Verb {
  public:
    static constexpr VerbInfo info = {
        "erase", changes | destroys,
        "Erases the RAID superblocks of MEMBERs, or with --uuid those of every disk and partition that belongs to that "
        "array. What is in use is refused.",
        "tavoctl raid erase sdb3\n"
        "tavoctl raid erase --uuid 495e879a:4e806313:a484c744:9c844bd2"};

    void Declare(Arguments &arguments) override
    {
        arguments.Texts("MEMBER", words_, member_help, 0, DeviceNames);
        arguments.Option("--uuid", "UUID", uuid_, "of an array that does not run");
    }

    int Run(const Call &call) override
    {
        if (words_.empty() == uuid_.empty())
            throw UsageFailure("erase superblocks", "name members, or say --uuid");
        if (uuid_.empty())
            EraseMembers(call);
        else
            EraseArray(call);
        return exit_done;
    }

  private:
    void EraseMembers(const Call &call) const
    {
        const std::vector<std::string> paths = DevicePaths(words_);
        const std::string attempted = "erase the superblocks of " + Listed(paths);
        RefuseUsed(paths, attempted);
        call.Confirm("Erase the superblocks of " + Listed(paths) + "?");
        for (const std::string &path : paths) {
            if (RAIDSBClean(path.c_str()) != 0)
                throw LibraryFailure("erase the superblock of " + path, log_hint);
        }
    }

    void EraseArray(const Call &call) const
    {
        const std::string attempted = "erase the superblocks of array " + uuid_;
        for (const Array &array : ReadArrays()) {
            char uuid[64];
            if (RAIDUUIDGet(array->szPath, uuid, sizeof uuid) == 1 && uuid_ == uuid)
                throw Failure{.attempted = attempted,
                              .reason = std::string(array->szPath) + " runs",
                              .hint = "stop it first",
                              .status = exit_busy};
        }
        call.Confirm("Erase all superblocks of array " + uuid_ + "?");
        if (RAIDSBCleanByUUID(nullptr, uuid_.c_str()) != 0)
            throw LibraryFailure(attempted, log_hint);
    }

    std::vector<std::string> words_;
    std::string uuid_;
};

}  // namespace

void AddRaidChange(Family &raid)
{
    raid.Add<RaidCreate>();
    raid.Add<RaidAdd>();
    raid.Add<RaidRemove>();
    raid.Add<RaidMigrate>();
    raid.Add<RaidStop>();
    raid.Add<RaidAssemble>();
    raid.Add<RaidErase>();
}

}  // namespace tavoctl
