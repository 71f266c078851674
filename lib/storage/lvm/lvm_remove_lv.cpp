// Removes what LVM has on a device.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/mount_table.h"
#include "storage/detail/device_name.h"
#include "storage/detail/partition_command.h"
#include "storage/detail/volume_name.h"

#include <unistd.h>

namespace {

template <class Arg>
void Try(tavo::FormatFor<Arg> format, const Arg &arg)
{
    const tavo::CommandResult result = tavo::RunDiskCommand(format, arg);
    if (result.status != 0)
        LogError("%s:%d Failed to %s", result.command);
}

bool IsSnapshotMount(const tavo::Mount &mount, const tavo::VolumeName &volume)
{
    const auto source = tavo::ParseVolumePath(mount.source);
    return source && source->group == volume.group && tavo::IsSnapshotName(source->volume, volume.volume) &&
           mount.type != "aufs" && mount.point != "/";
}

void RemoveSnapshots(const tavo::VolumeName &volume)
{
    std::vector<tavo::Mount> mounts;
    if (!tavo::ReadMounts(mounts))
        LogError("%s:%d Failed to read /proc/mounts");
    for (const tavo::Mount &mount : mounts) {
        if (!IsSnapshotMount(mount, volume))
            continue;
        Try("umount -f %s > /dev/null 2>&1", mount.point);
        ::sleep(1);
        if (::rmdir(mount.point.c_str()) != 0)
            LogError("%s:%d Failed to rmdir(%s)", mount.point);
        Try("lvremove -f %s > /dev/null 2>&1", mount.source);
    }
}

}  // namespace

extern "C" int LVMRemoveLV(const char *szDevice)
{
    if (!szDevice || !tavo::IsDevicePath(szDevice)) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        char path[512];
        if (LVMGetLVPath(szDevice, path, sizeof path) != 1)
            return 0;
        const auto volume = tavo::ParseVolumePath(path);
        if (!volume)
            return 0;
        RemoveSnapshots(*volume);
        Try("lvremove -f %s > /dev/null 2>&1", path);
        Try("vgremove -f %s > /dev/null 2>&1", std::string(tavo::kDev) + volume->group);
        Try("pvremove -f %s > /dev/null 2>&1", szDevice);
        return 0;
    });
}
