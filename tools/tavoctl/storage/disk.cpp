// tavoctl disk: the disks, their health and their power.
#include "families.h"
#include "storage/arrays.h"
#include "storage/device.h"
#include "storage/disk_facts.h"
#include "storage/disk_verbs.h"
#include "storage/smart.h"

namespace tavoctl {
namespace {

constexpr Column<DiskFacts> disk_columns[] = {
    {"bay", field<&DiskFacts::bay>, "1 for an internal bay, 1-2 in a unit, usb, esata, nvme"},
    {"disk", [](const DiskFacts &d) { return DeviceName(d.path); }},
    {"path", field<&DiskFacts::path>, "", in_details},
    {"model", field<&DiskFacts::model>},
    {"serial", field<&DiskFacts::serial>, "as on the label of the disk"},
    {"size", field<&DiskFacts::size>},
    {"solid_state",
     [](const DiskFacts &d) {
         const int solid = d.asked ? TAVODiskIsSSD(d.path.c_str()) : -1;
         return solid < 0 ? std::nullopt : std::optional(solid == 1);
     },
     "", in_one},
    {"temperature", field<&DiskFacts::temperature>, "", in_list, "degrees Celsius"},
    {"state", [](const DiskFacts &d) { return d.State(); },
     "standby or spinning; of a bay without a disk empty, or pulled while arrays still have it"},
    {"health", field<&DiskFacts::health>, "of an NVMe disk", in_details},
    {"write_cache",
     [](const DiskFacts &d) {
         return d.asked ? std::optional(TAVODiskWriteCacheGet(d.path.c_str()) == 1) : std::nullopt;
     },
     "", in_one},
    {"layout", field<&DiskFacts::layout>, "of the system, or blank, or foreign"},
    {"role", field<&DiskFacts::role>, "the arrays that it serves, or that miss it"},
    {"use", [](const DiskFacts &d) { return Maybe(UseOf(d.path)); }, "why it must not be overwritten", in_one},
};

struct DiskTemperature {
    std::string disk;
    int temperature;
};

constexpr Column<DiskTemperature> temperature_columns[] = {
    {"disk", field<&DiskTemperature::disk>},
    {"temperature", field<&DiskTemperature::temperature>, "", in_list, "degrees Celsius"},
};

constexpr Column<SmartAttribute> smart_columns[] = {
    {"id", field<&SmartAttribute::id>},
    {"name", [](const SmartAttribute &a) { return std::string(SmartName(a.id)); }},
    {"value", field<&SmartAttribute::value>},
    {"worst", field<&SmartAttribute::worst>},
    {"threshold", [](const SmartAttribute &a) { return a.threshold < 0 ? std::nullopt : std::optional(a.threshold); }},
    {"state", [](const SmartAttribute &a) -> std::string { return a.Fails() ? "failing" : "good"; }, "failing or good"},
    {"raw", field<&SmartAttribute::raw>},
};

struct WipingJob {
    std::string disk;
    uint64_t done, total;  // MiB
};

constexpr uint64_t mib = 1 << 20;

constexpr Column<WipingJob> wiping_columns[] = {
    {"disk", field<&WipingJob::disk>},
    {"done", [](const WipingJob &job) { return Bytes{job.done * mib}; }},
    {"total", [](const WipingJob &job) { return Bytes{job.total * mib}; }},
    {"percent",
     [](const WipingJob &job) { return job.total ? std::optional(job.done * 100 / job.total) : std::nullopt; }},
};

Action DiskList(Arguments &in)
{
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) { call.List(disk_columns, AllDisks(*wake, ReadArrays())); };
}

Action DiskInfo(Arguments &in)
{
    const auto disk = in.Text("DISK", disk_kind, disk_help);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) { call.One(disk_columns, DescribeDisk(DiskPath(*disk), *wake, ReadArrays())); };
}

Action DiskSmart(Arguments &in)
{
    const auto disk = in.Text("DISK", disk_kind, disk_help);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) {
        const std::string path = DiskPath(*disk);
        const std::string attempted = "read the SMART data of " + path;
        RefuseToWake(path, *wake, attempted);
        call.List(smart_columns, ReadSmart(path, attempted));
    };
}

Action ShowTemperature(Arguments &in)
{
    const auto disk = in.Text("DISK", disk_kind, disk_help);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) {
        const std::string path = DiskPath(*disk);
        const std::string attempted = "read the temperature of " + path;
        RefuseToWake(path, *wake, attempted);
        const int degrees = TAVODiskTemperatureGet(path.c_str());
        FailIf(degrees == -1, attempted, "the disk does not tell it");
        call.Value(std::to_string(degrees), temperature_columns, DiskTemperature{path, degrees});
    };
}

Action DiskWipeStatus(Arguments &in)
{
    const auto disk = in.Text("DISK", disk_kind, disk_help);
    return [=](Call &call) {
        const std::string path = DevicePath(*disk);
        const std::string attempted = "read how far the wiping of " + path + " has come";
        constexpr uint64_t untouched = ~uint64_t{0};
        WipingJob job = {path, untouched, untouched};
        FailIf(DiskDDStatusGet(path.c_str(), &job.done, &job.total) != 0, attempted, "the job's file is malformed");
        if (job.done == untouched)
            throw NotFound(attempted, ERR_FILE_NOT_FOUND, "no such job runs");
        call.One(wiping_columns, job);
    };
}

// A number that is among those that the drives know is the library's business.
constexpr ArgumentKind minutes_kind = {
    .name = "minutes",
    .allowed = "0, 1 to 21, multiples of 30 up to 330, and 480",
    .valid =
        [](const std::string &text) {
            return !text.empty() && text.size() <= 3 && text.find_first_not_of("0123456789") == text.npos;
        },
    .sample = "20",
    .wrong = "5x",
};

Action DiskStandby(Arguments &in)
{
    const auto words = in.Texts("DISK", disk_kind, disk_help, 0);
    const auto all = in.Flag("--all", "all disks");
    const auto timer = in.Option("--timer", "MINUTES", minutes_kind, "set the spin-down timer of all disks instead");
    return [=](Call &call) {
        RefuseIf(!words->empty() + *all + timer->has_value() != 1, "spin down", "name disks, or use --all, or --timer");
        if (*timer) {
            call.Change("all disks", "spin-down timer", {}, **timer);
            if (call.Proceed("Set the spin-down timer of all disks?"))
                Must(TAVODiskSetStandbyTimer(std::stoi(**timer)) == 0,
                     "set the spin-down timer to " + **timer + " minutes",
                     std::string("allowed: ") + minutes_kind.allowed);
        } else if (*all) {
            call.Change("all disks", "state", {}, "standby");
            if (call.Proceed("Spin down all disks, the system's own too?"))
                Must(TAVODiskSetStandby() == 0, "spin down all disks");
        } else {
            const std::vector<std::string> paths = DiskPaths(*words);
            for (const std::string &path : paths)
                call.Change(path, "state", {}, "standby");
            if (!call.Proceed("Spin down " + Joined(paths, ", ") + "?"))
                return;
            // Flushing first: a later write would wake it again.
            for (const std::string &path : paths)
                Must(TAVOIDiskFlushBuffer(path.c_str()) == 0 && TAVOIDiskSetDiskStandby(path.c_str()) == 0,
                     "spin down " + path);
        }
    };
}

Action DiskCache(Arguments &in)
{
    const auto disk = in.Text("DISK", disk_kind, disk_help);
    const auto state = in.Choice("STATE", {"on", "off"}, "on or off");
    return [=](Call &call) {
        const std::string path = DiskPath(*disk);
        const std::string attempted = "switch the write cache of " + path + " " + *state;
        const int wanted = *state == "on";
        call.Change(path, "write_cache", TAVODiskWriteCacheGet(path.c_str()) == 1, wanted == 1);
        if (!call.Proceed())
            return;
        Must(TAVODiskWriteCacheSet(path.c_str(), wanted) == 0, attempted);
        FailIf(TAVODiskWriteCacheGet(path.c_str()) != wanted, attempted, "the drive has not done it");
    };
}

}  // namespace

void AddDisk(Program &program)
{
    Family &disk = program.Add("disk", "Disks: what they are, their health and their power");
    disk.Add("list", reads, Answer::List(disk_columns), DiskList,
             R"(Lists the bays with their disks, then other disks, and the
arrays that each serves. A disk in standby is not read, so its temperature and layout are not known.

tavoctl disk list
tavoctl disk list --wake --json)");
    disk.Add("info", reads, Answer::One(disk_columns), DiskInfo,
             R"(Shows what is known of a disk. One in standby is not read
unless --wake is given.

tavoctl disk info sda
tavoctl disk info --wake --json /dev/sdb)");
    disk.Add("smart", reads, Answer::List(smart_columns), DiskSmart,
             R"(Lists the SMART attributes of a disk. The drive's own value
counts down from 100 or so, and at its threshold the drive expects to fail. A disk in standby is not read unless --wake
is given.

tavoctl disk smart sda
tavoctl disk smart --wake --json sdb)");
    disk.Add("health", reads, Answer::List(health_columns), DiskHealthList,
             R"(Reports one verdict on each disk, with its reason: good;
worn, which is to be replaced soon (sectors could not be read, or had to be replaced); failing (an attribute has reached
its threshold, or a self-test failed), with exit status 1. A disk in standby is not read unless --wake is given.

tavoctl disk health
tavoctl disk health --json sda sdb)");
    disk.Add("errors", reads, Answer::List(error_columns), DiskErrors,
             R"(Lists the last five errors that a disk has written down
itself, the newest first. A disk in standby is not read unless --wake is given.

tavoctl disk errors sda
tavoctl disk errors --wake --json sdb)");
    disk.Add("test", changes, DiskTest, R"(Starts the drive's own test, which goes on in the background while the
disk is used. `disk health` shows how far it is and what came of it.

tavoctl disk test --short sda
tavoctl disk test --long --wait sda
tavoctl disk test --stop sda)");
    disk.Add("temperature", reads, Answer::One(temperature_columns), ShowTemperature,
             R"(Prints the temperature of a disk in degrees
Celsius. A disk in standby is not read unless --wake is given.

tavoctl disk temperature sda)");
    disk.Add("wipe-status", reads, Answer::One(wiping_columns), DiskWipeStatus,
             R"(Shows how far the wiping job of a disk has come.

tavoctl disk wipe-status sda)");
    disk.Add("standby", changes | destroys, DiskStandby, R"(Writes out what the system holds for a disk and spins it
down. --all does it to every disk, which takes more than ten seconds, the system's own and USB disks included. --timer
sets after how many idle minutes the drives spin down by themselves: 0 never, 1 to 21, multiples of 30 up to 330, or
480. The minutes are saved; the drives' own timer is 5.5 hours for every choice but 0, since it only backs up the
system's.

tavoctl disk standby sdb
tavoctl disk standby --yes --all
tavoctl disk standby --yes --timer 20)");
    disk.Add("cache", changes, DiskCache, R"(Switches the write cache of a drive. With it a power failure loses
what the drive has not written yet; without it writing is slower. `disk info` shows its state.

tavoctl disk cache sda off)");
}

}  // namespace tavoctl
