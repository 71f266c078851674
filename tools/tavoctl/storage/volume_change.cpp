// tavoctl volume: making, mounting and growing.
#include "tavo_lvm.h"

#include "frame/containers.h"
#include "storage/device.h"
#include "storage/mounted_volumes.h"
#include "storage/volume_groups.h"
#include "storage/volume_verbs.h"

#include <cerrno>
#include <iostream>
#include <sstream>

#include <sys/mount.h>
#include <sys/stat.h>

namespace tavoctl {
namespace {

constexpr char volume_name[] = "lv";

void MountAt(const std::string &device, const std::string &place, const std::string &attempted)
{
    if (::mkdir(place.c_str(), 0755) != 0 && errno != EEXIST)
        throw SystemFailure(attempted, errno);
    if (::mount(device.c_str(), place.c_str(), "ext4", 0, nullptr) != 0)
        throw SystemFailure(attempted, errno);
}

void MountVolume(const Volume &volume, const std::string &place)
{
    const std::string attempted = "mount " + volume.device + " on " + place;
    ActiveVolume active(volume, attempted);
    MountAt(volume.device, place, attempted);
    active.Keep();
}

void RefuseMounted(const std::string &place, const std::string &attempted)
{
    for (const Mount &mount : Mounts())
        BusyIf(mount.place == place, attempted, mount.source + " is mounted there");
}

// The numbers that pvs prints, in a row for each device.
std::vector<std::vector<uint64_t>> NumbersOf(const std::string &group, const std::string &attempted)
{
    const std::string numbers =
        RunTool({"/sbin/pvs", "--noheadings", "--units", "b", "--nosuffix", "-o",
                 "dev_size,pe_start,pv_pe_count,vg_extent_size,vg_free_count", "-S", "vg_name=" + group},
                attempted);
    std::vector<std::vector<uint64_t>> rows;
    for (const std::string &line : Split(numbers, '\n')) {
        std::istringstream words(line);
        std::vector<uint64_t> row(5);
        if (words >> row[0] >> row[1] >> row[2] >> row[3] >> row[4] && row[3] > 0)
            rows.push_back(row);
    }
    return rows;
}

// How large the volume will be, when the group is as large as its devices; it has no other volumes then.
uint64_t SizeToCome(const Volume &volume, const std::string &attempted)
{
    uint64_t size = volume.size->count;
    bool first = true;
    for (const auto &row : NumbersOf(volume.group, attempted)) {
        const uint64_t extents = row[0] > row[1] ? (row[0] - row[1]) / row[3] : 0;
        size += (extents > row[2] ? extents - row[2] : 0) * row[3] + (first ? row[4] * row[3] : 0);
        first = false;
    }
    return size;
}

}  // namespace

Volume FindStoredVolume(int number, const std::string &attempted)
{
    RefuseWithoutLvm(attempted);
    for (const bool all : {false, true})
        for (Volume &volume : ReadVolumes(all))
            if (volume.Number() == number)
                return std::move(volume);
    throw Absent(attempted, "there is no volume " + std::to_string(number), "tavoctl volume list shows what is there");
}

ActiveVolume::ActiveVolume(const Volume &volume, const std::string &attempted)
{
    if (volume.active)
        return;
    RunTool({"/sbin/vgchange", "-a", "y", volume.group}, attempted);
    group_ = volume.group;
}

ActiveVolume::~ActiveVolume()
{
    try {
        if (!group_.empty())
            TryTool({"/sbin/vgchange", "-a", "n", group_});
    } catch (const Failure &failure) {
        std::cerr << failure.Text(false) << "\n";
    }
}

Action VolumeCreate(Arguments &in)
{
    const auto word = in.Text("VOLUME", volume_kind, volume_help);
    const auto words = in.Texts("DEVICE", device_kind, "usually an array, md2 or /dev/md2");
    return [=](Call &call) {
        const int number = std::stoi(*word);
        const std::string place = VolumePath(number);
        const std::string group = VolumeGroupOf(number);
        const std::string attempted = "make " + place;
        RefuseWithoutLvm(attempted);
        RefuseMounted(place, attempted);
        const std::vector<std::string> paths = DevicePaths(*words);
        LVMVG present;
        FailIf(LVMVgSBGet(group.c_str(), &present) == 1, attempted, "the group " + group + " is there already",
               "tavoctl volume mount mounts it; tavoctl lvm remove removes it");
        RefuseUsed(paths, attempted);
        RefuseGrouped(paths, attempted);
        RefuseTooLarge(SizeOfAll(paths), attempted);
        const std::string device = group + "/" + volume_name;
        call.Change(place, "devices", {}, paths);
        call.Change(place, "device", {}, device);
        call.Change(place, "file system", {}, "ext4");
        if (!call.Proceed("Lose what is on " + Joined(paths, ", ") + "?"))
            return;
        Must(LVMCreate(StringList(paths).Get(), group.c_str(), volume_name, nullptr, 0) == 0, attempted, log_hint);
        try {
            RunTool({"/sbin/mkfs.ext4", "-q", "-F", device}, attempted);
            MountAt(device, place, attempted);
        } catch (const Failure &) {
            // Half a volume would be in the way of the next attempt.
            LVMRemove(group.c_str(), volume_name);
            LVMVgRemove(group.c_str());
            for (const std::string &path : paths)
                LVMPvRemove(path.c_str());
            throw;
        }
    };
}

Action VolumeMount(Arguments &in)
{
    const auto word = in.OptionalText("VOLUME", volume_kind, volume_help);
    const auto all = in.Flag("--all", "every volume");
    return [=](Call &call) {
        RefuseIf(*all + word->has_value() != 1, "mount volumes", "name one, or use --all");
        std::vector<Volume> volumes;
        if (*all)
            volumes = ReadVolumes(true);
        else
            volumes.push_back(FindStoredVolume(std::stoi(**word), "mount /volume" + **word));
        std::erase_if(volumes, [](const Volume &volume) { return !volume.Number() || !volume.mount.empty(); });
        for (const Volume &volume : volumes) {
            const std::string place = VolumePath(*volume.Number());
            RefuseMounted(place, "mount " + place);
            call.Change(place, "device", {}, volume.device);
        }
        if (!call.Proceed())
            return;
        for (const Volume &volume : volumes) {
            const std::string place = VolumePath(*volume.Number());
            try {
                MountVolume(volume, place);
            } catch (const Failure &failure) {
                if (!*all)
                    throw;
                Warn(place + " is not mounted: " + failure.reason);
                std::erase_if(call.report.changes, [&](const Change &change) { return change.object == place; });
                call.status = exit_failed;
            }
        }
    };
}

Action VolumeUnmount(Arguments &in)
{
    const auto word = in.Text("VOLUME", volume_kind, volume_help);
    return [=](Call &call) {
        const std::string attempted = "unmount /volume" + *word;
        const Volume volume = FindStoredVolume(std::stoi(*word), attempted);
        if (!volume.mount.empty())
            call.Change(volume.mount, "device", volume.device, {});
        if (volume.active)
            call.Change(volume.device, "active", true, false);
        if (!call.Proceed())
            return;
        if (!volume.mount.empty() && ::umount2(volume.mount.c_str(), 0) != 0) {
            if (errno == EBUSY)
                throw BusyFailure(attempted, "programs have files open there",
                                  "tavoctl service list --volume " + volume.mount + " shows the services on it");
            throw SystemFailure(attempted, errno);
        }
        RunTool({"/sbin/vgchange", "-a", "n", volume.group}, "let go of " + volume.device);
    };
}

Action VolumeGrow(Arguments &in)
{
    const auto word = in.Text("VOLUME", volume_kind, volume_help);
    return [=](Call &call) {
        const std::string attempted = "grow /volume" + *word;
        const Volume volume = FindStoredVolume(std::stoi(*word), attempted);
        FailIf(volume.mount.empty(), attempted, "it is not mounted", "mount it first");
        const VolumeGroup group = ReadVgInfo("/dev/" + volume.group, attempted);
        const uint64_t size = SizeToCome(volume, attempted);
        RefuseTooLarge(size, attempted);
        const auto system = ReadExtFileSystem(volume.device);
        call.Change(volume.mount, "size", volume.size, Bytes{size});
        // An interrupted attempt may have left the file system smaller than the device.
        constexpr uint64_t block = 4096;
        if (system && system->size + block <= volume.size->count)
            call.Change(volume.mount, "file system", Bytes{system->size}, Bytes{size});
        if (!call.Proceed())
            return;
        if (size > volume.size->count) {
            Must(LVMPvExpand(group.get()) == 0, attempted, log_hint);
            RunTool({"/sbin/lvextend", "-l", "+100%FREE", volume.device}, attempted);
        }
        RunTool({"/sbin/resize2fs", volume.device}, attempted);
    };
}

}  // namespace tavoctl
