// tavoctl volume: the file systems where services and users keep their data.
#include "families.h"
#include "storage/device.h"
#include "storage/mounted_volumes.h"
#include "storage/volume_verbs.h"
#include "storage/volumes.h"

#include <algorithm>

namespace tavoctl {
namespace {

constexpr Column<Volume> volume_columns[] = {
    {"volume", [](const Volume &v) { return v.Number(); }},
    {"path", [](const Volume &v) { return Maybe(v.mount); }, "where it is mounted"},
    {"device", field<&Volume::device>},
    {"group", field<&Volume::group>, "", in_details},
    {"devices", field<&Volume::devices>, "that it is on"},
    {"active", field<&Volume::active>, "the kernel has it", in_details},
    {"size", field<&Volume::size>, "of the device"},
    {"capacity", field<&Volume::capacity>, "of the mounted file system", in_details},
    {"available", field<&Volume::available>, "for users"},
    {"used",
     [](const Volume &v) {
         return v.capacity && v.capacity->count ? std::optional(100 - 100 * v.available->count / v.capacity->count)
                                                : std::nullopt;
     },
     "", in_list, "percent"},
};

struct CheckedVolume {
    int volume;
    std::string device, state;
    std::vector<std::string> report;
};

constexpr Column<CheckedVolume> check_columns[] = {
    {"volume", field<&CheckedVolume::volume>},
    {"device", field<&CheckedVolume::device>},
    {"state", field<&CheckedVolume::state>, "clean, repaired or damaged"},
    {"report", field<&CheckedVolume::report>, "what the tool said"},
};

Action VolumeList(Arguments &in)
{
    const auto wake = in.Flag("--wake", "look for volumes that are not active although that wakes the disks");
    return [=](Call &call) {
        const std::vector<std::string> disks = DiskPaths();
        const bool sleeps = std::any_of(disks.begin(), disks.end(), Sleeps);
        call.List(volume_columns, ReadVolumes(*wake || !sleeps));
    };
}

Action VolumeCheck(Arguments &in)
{
    const auto word = in.Text("VOLUME", volume_kind, volume_help);
    const auto repair = in.Flag("--repair", "mend what is found");
    return [=](Call &call) {
        const int number = std::stoi(*word);
        const std::string attempted = "check " + VolumePath(number);
        const Volume volume = FindStoredVolume(number, attempted);
        BusyIf(!volume.mount.empty(), attempted, "it is mounted on " + volume.mount, "tavoctl volume unmount " + *word);
        const bool mends = *repair && !call.dry_run;
        const ActiveVolume active(volume, attempted);
        const ToolResult done = TryTool({"/sbin/e2fsck", "-f", mends ? "-y" : "-n", volume.device});
        CheckedVolume result = {number, volume.device, {}, {}};
        constexpr int mended = 3;  // bits of its status: errors corrected, and restart the system
        if ((done.status & ~mended) == 0 && (mends || done.status == 0))
            result.state = done.status ? "repaired" : "clean";
        else if (constexpr int errors_left = 4; (done.status & ~(mended | errors_left)) == 0)
            result.state = "damaged";
        else
            throw Failure{.attempted = attempted, .reason = done.Reason()};
        result.report = Split(done.output, '\n');
        std::erase(result.report, "");
        call.One(check_columns, result);
        if (result.state == "damaged")
            call.status = exit_failed;
    };
}

}  // namespace

void AddVolume(Program &program)
{
    Family &volume = program.Add("volume", "Volumes: the file systems on the arrays");
    volume.Add("list", reads, Answer::List(volume_columns), VolumeList,
               R"(Lists the volumes: where each is mounted, what it is on,
and how much room it has. While a disk is in standby only those that the kernel has are listed, unless --wake is given.

tavoctl volume list)");
    volume.Add("create", changes | destroys, VolumeCreate, R"(Makes a volume of DEVICEs, usually one array: a volume
group, the logical volume that fills it, and an ext4 file system, which is mounted. What is on them is lost; one that is
in use is refused.

tavoctl volume create 1 md2
tavoctl volume create --yes 2 md3 md4)");
    volume.Add("mount", changes, VolumeMount, R"(Mounts a volume, after a start of the system for example. --all
mounts all there are.

tavoctl volume mount 1
tavoctl volume mount --all)");
    volume.Add("unmount", changes, VolumeUnmount, R"(Unmounts a volume and lets go of its devices, so that its arrays
can be stopped. One with open files is refused; services that use it are stopped first.

tavoctl volume unmount 1)");
    volume.Add("grow", changes, VolumeGrow, R"(Has a mounted volume use the whole of its devices, after an array
has grown. It stays in use meanwhile.

tavoctl volume grow 1)");
    volume.Add("check", changes, Answer::One(check_columns), VolumeCheck,
               R"(Checks the file system of a volume that is not mounted;
exit status 1 when it is damaged. Nothing is written unless --repair is given.

tavoctl volume check 1
tavoctl volume check --repair 1)");
}

}  // namespace tavoctl
