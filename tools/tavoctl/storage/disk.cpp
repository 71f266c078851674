// tavoctl disk: the disks, their health and their power.
#include "families.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/table.h"
#include "storage/arrays.h"
#include "storage/device.h"
#include "storage/disk_power.h"
#include "storage/disk_verb.h"
#include "storage/smart.h"

#include "tavo_lvm.h"
#include "tavo_partition.h"

#include <algorithm>

namespace tavoctl {
namespace {

// What is known of a disk without waking it.
struct DiskFacts {
    std::string path;
    Power power;
    Cell model, size, temperature, layout;

    DiskFacts(const std::string &disk, bool wake) : path(disk), power(PowerOf(disk))
    {
        char text[128];
        if (TAVOLnxDiskGetModel(disk.c_str(), text, sizeof text) == 0)
            model = std::string(text).substr(0, std::string(text).find_last_not_of(' ') + 1);
        uint64_t sectors = 0;
        if (DiskSizeGet(disk.c_str(), &sectors) == 1)
            size = Bytes{sectors * 512};
        if (power != Power::spinning && !wake)
            return;
        layout = Layout();
        if (const int degrees = TAVODiskTemperatureGet(disk.c_str()); degrees != -1)
            temperature = degrees;
    }

    Cell State() const
    {
        return power == Power::unknown ? Cell() : Cell(power == Power::standby ? "standby" : "spinning");
    }

  private:
    Cell Layout() const
    {
        int version = 0;
        for (const int raid : {1, 0}) {
            if (BlTAVOCheckPartitionLayout(path.c_str(), raid, &version) == 1)
                return "version " + std::to_string(version) + (raid ? "" : " plain");
        }
        int kind = 0;
        if (PartitionTableTypeGet(path.c_str(), &kind) != 0)
            return {};
        return kind == PARTITION_TABLE_NONE ? "blank" : "foreign";
    }
};

class DiskList : public Verb {
  public:
    static constexpr VerbInfo info = {
        "list", reads,
        "Lists the disks, those of the bays first, and the arrays that each serves. A disk "
        "in standby is not read, so its temperature and layout are not known.",
        "tavoctl disk list\n"
        "tavoctl disk list --wake --json"};

    void Declare(Arguments &arguments) override { arguments.Flag("--wake", wake_, wake_help); }

    int Run(const Call &call) override
    {
        const std::vector<Array> arrays = ReadArrays();
        Table table({"bay", "disk", "model", "size", "temperature", "state", "layout", "role"});
        for (const std::string &path : DiskPaths()) {
            const DiskFacts disk(path, wake_);
            table.Add({BayOf(path), DeviceName(path), disk.model, disk.size, disk.temperature, disk.State(),
                       disk.layout, ArraysOf(arrays, path)});
        }
        call.Print(table);
        return exit_done;
    }

  private:
    bool wake_ = false;
};

class DiskInfo : public WakingVerb {
  public:
    static constexpr VerbInfo info = {
        "info", reads, "Shows what is known of a disk. One in standby is not read unless --wake is given.",
        "tavoctl disk info sda\n"
        "tavoctl disk info --wake --json /dev/sdb"};

    int Run(const Call &call) override
    {
        const std::string path = DiskPath(disk_);
        const DiskFacts disk(path, wake_);
        const bool asked = wake_ || disk.power == Power::spinning;
        const int solid = asked ? TAVODiskIsSSD(path.c_str()) : -1;
        Record record;
        record.Add("disk", path);
        record.Add("bay", BayOf(path));
        record.Add("model", disk.model);
        record.Add("size", disk.size);
        record.Add("solid_state", solid < 0 ? Cell() : Cell(solid == 1));
        record.Add("temperature", disk.temperature);
        record.Add("state", disk.State());
        record.Add("write_cache", asked ? Cell(TAVODiskWriteCacheGet(path.c_str()) == 1) : Cell());
        record.Add("layout", disk.layout);
        record.Add("role", ArraysOf(ReadArrays(), path));
        record.Add("use", Known(UseOf(path)));
        call.Print(record);
        return exit_done;
    }
};

class DiskSmart : public WakingVerb {
  public:
    static constexpr VerbInfo info = {"smart", reads,
                                      "Lists the SMART attributes of a disk: the drive's own value counts down from "
                                      "100 or so, and at its threshold the "
                                      "drive expects to fail. A disk in standby is not read unless --wake is given.",
                                      "tavoctl disk smart sda\n"
                                      "tavoctl disk smart --wake --json sdb"};

    int Run(const Call &call) override
    {
        const std::string path = DiskPath(disk_);
        const std::string attempted = "read the SMART data of " + path;
        RefuseToWake(path, wake_, attempted);
        Table table({"id", "name", "value", "worst", "threshold", "state", "raw"});
        for (const SmartAttribute &attribute : ReadSmart(path, attempted))
            table.Add({attribute.id, SmartName(attribute.id), attribute.value, attribute.worst,
                       attribute.threshold < 0 ? Cell() : Cell(attribute.threshold),
                       attribute.Fails() ? "failing" : "good", static_cast<int64_t>(attribute.raw)});
        call.Print(table);
        return exit_done;
    }
};

class DiskTemperature : public WakingVerb {
  public:
    static constexpr VerbInfo info = {
        "temperature", reads,
        "Prints the temperature of a disk in degrees Celsius. A disk in standby is not read "
        "unless --wake is given.",
        "tavoctl disk temperature sda"};

    int Run(const Call &call) override
    {
        const std::string path = DiskPath(disk_);
        const std::string attempted = "read the temperature of " + path;
        RefuseToWake(path, wake_, attempted);
        const int degrees = TAVODiskTemperatureGet(path.c_str());
        if (degrees == -1)
            throw Failure{.attempted = attempted, .reason = "the disk does not tell it"};
        Record record;
        record.Add("disk", path);
        record.Add("temperature", degrees);
        call.PrintValue(std::to_string(degrees), record);
        return exit_done;
    }
};

class DiskWipeStatus : public DiskVerb {
  public:
    static constexpr VerbInfo info = {"wipe-status", reads, "Shows how far the wiping job of a disk has come.",
                                      "tavoctl disk wipe-status sda"};

    int Run(const Call &call) override
    {
        const std::string path = DevicePath(disk_);
        const std::string attempted = "read how far the wiping of " + path + " has come";
        constexpr uint64_t untouched = ~uint64_t{0};
        uint64_t done = untouched;
        uint64_t total = untouched;
        if (DiskDDStatusGet(path.c_str(), &done, &total) != 0)
            throw Failure{.attempted = attempted, .reason = "the job's file is malformed"};
        if (done == untouched)
            throw NotFound(attempted, ERR_FILE_NOT_FOUND, "no such job runs");
        constexpr uint64_t mib = 1 << 20;
        Record record;
        record.Add("disk", path);
        record.Add("done", Bytes{done * mib});
        record.Add("total", Bytes{total * mib});
        record.Add("percent", total ? Cell(static_cast<int>(done * 100 / total)) : Cell());
        call.Print(record);
        return exit_done;
    }
};

}  // namespace

void AddDisk(Program &program)
{
    Family &disk = program.Add("disk", "Disks: what they are, their health and their power");
    disk.Add<DiskList>();
    disk.Add<DiskInfo>();
    disk.Add<DiskSmart>();
    disk.Add<DiskTemperature>();
    disk.Add<DiskWipeStatus>();
    AddDiskPower(disk);
}

}  // namespace tavoctl
