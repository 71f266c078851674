// tavoctl disk: standby, the spin-down timer and the write cache.
#include "storage/disk_power.h"

#include "frame/failure.h"
#include "frame/program.h"
#include "storage/disk_verb.h"

#include "tavo_disk.h"

namespace tavoctl {
namespace {

class DiskStandby : public Verb {
  public:
    static constexpr VerbInfo info = {"standby", changes | destroys,
                                      "Writes out what the system holds for a disk and spins it down. --all does it to "
                                      "every disk, which takes more than "
                                      "ten seconds, the system's own and USB disks included. --timer sets after how "
                                      "many idle minutes the drives spin "
                                      "down by themselves: 0 never, 1 to 21, multiples of 30 up to 330, or 480. The "
                                      "minutes are saved; the drives' own "
                                      "timer is 5.5 hours for every choice but 0, since it only backs up the system's.",
                                      "tavoctl disk standby sdb\n"
                                      "tavoctl disk standby --yes --all\n"
                                      "tavoctl disk standby --yes --timer 20"};

    void Declare(Arguments &arguments) override
    {
        arguments.Texts("DISK", disks_, disk_help, 0, DiskNames);
        arguments.Flag("--all", all_, "all disks");
        arguments.Option("--timer", "MINUTES", minutes_, "set the spin-down timer of all disks instead");
    }

    int Run(const Call &call) override
    {
        if ((disks_.empty() ? 0 : 1) + (all_ ? 1 : 0) + (minutes_.empty() ? 0 : 1) != 1)
            throw UsageFailure("spin down", "name disks, or say --all, or --timer");
        if (!minutes_.empty())
            SetTimer(call);
        else if (all_)
            SpinDownAll(call);
        else
            SpinDown(call);
        return exit_done;
    }

  private:
    void SetTimer(const Call &call) const
    {
        const std::string attempted = "set the spin-down timer to " + minutes_ + " minutes";
        if (minutes_.empty() || minutes_.size() > 3 || minutes_.find_first_not_of("0123456789") != minutes_.npos)
            throw UsageFailure(attempted, "it is no number of minutes");
        call.Confirm("Set the spin-down timer of all disks?");
        if (TAVODiskSetStandbyTimer(std::stoi(minutes_)) != 0)
            throw LibraryFailure(attempted, "0, 1 to 21, multiples of 30 up to 330, and 480 are possible");
    }

    static void SpinDownAll(const Call &call)
    {
        call.Confirm("Spin down all disks, the system's own too?");
        if (TAVODiskSetStandby() != 0)
            throw LibraryFailure("spin down all disks");
    }

    void SpinDown(const Call &call) const
    {
        std::vector<std::string> paths;
        for (const std::string &word : disks_)
            paths.push_back(DiskPath(word));
        call.Confirm("Spin down " + Listed(paths) + "?");
        for (const std::string &path : paths) {
            // Flushing first: what is written later would wake it again.
            if (TAVOIDiskFlushBuffer(path.c_str()) != 0 || TAVOIDiskSetDiskStandby(path.c_str()) != 0)
                throw LibraryFailure("spin down " + path);
        }
    }

    std::vector<std::string> disks_;
    bool all_ = false;
    std::string minutes_;
};

class DiskCache : public DiskVerb {
  public:
    static constexpr VerbInfo info = {"cache", changes,
                                      "Switches the write cache of a drive. With it a power failure loses what the "
                                      "drive has not written yet; without "
                                      "it writing is slower. `disk info` shows its state.",
                                      "tavoctl disk cache sda off"};

    void Declare(Arguments &arguments) override
    {
        DiskVerb::Declare(arguments);
        arguments.Text("STATE", state_, "on or off", [] { return std::vector<std::string>{"on", "off"}; });
    }

    int Run(const Call &) override
    {
        if (state_ != "on" && state_ != "off")
            throw UsageFailure("switch the write cache " + state_, "say on or off");
        const std::string path = DiskPath(disk_);
        const std::string attempted = "switch the write cache of " + path + " " + state_;
        const int wanted = state_ == "on" ? 1 : 0;
        if (TAVODiskWriteCacheSet(path.c_str(), wanted) != 0)
            throw LibraryFailure(attempted);
        if (TAVODiskWriteCacheGet(path.c_str()) != wanted)
            throw Failure{.attempted = attempted, .reason = "the drive has not done it"};
        return exit_done;
    }

  private:
    std::string state_;
};

}  // namespace

void AddDiskPower(Family &disk)
{
    disk.Add<DiskStandby>();
    disk.Add<DiskCache>();
}

}  // namespace tavoctl
