// Removes physical volumes that are on no array.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/mount_table.h"
#include "core/detail/text_fields.h"
#include "storage/detail/device_name.h"
#include "storage/detail/device_use.h"
#include "storage/detail/kernel_text.h"
#include "storage/detail/usb_id.h"
#include "storage/detail/volume_name.h"

#include <cstring>
#include <memory>
#include <vector>

namespace {

bool IsMounted(std::string_view group)
{
    std::vector<tavo::Mount> mounts;
    if (!tavo::ReadMounts(mounts))
        return true;  // not known
    for (const tavo::Mount &mount : mounts) {
        const auto source = tavo::ParseVolumePath(mount.source);
        if (source && tavo::LastPart(group) == source->group)
            return true;
    }
    return false;
}

bool IsOnDisk(const LVMPV &pv)
{
    return std::string_view(pv.szPv).starts_with("/dev/sd");
}

// A USB stick or disk, which its owner wants back. A disk that sysfs does not describe counts as one in a bay.
bool IsOnUsb(const LVMPV &pv)
{
    return IsOnDisk(pv) && tavo::UsbIdOfDisk(tavo::WithoutNumber(tavo::WithoutDev(pv.szPv))).has_value();
}

// A group that reaches onto such a disk goes as a whole, or not at all.
bool IsForeign(const LVMPVLIST *all, const LVMPV &pv)
{
    if (IsOnUsb(pv))
        return true;
    for (; pv.szVg[0] && all; all = all->pNext) {
        if (std::strcmp(all->pv.szVg, pv.szVg) == 0 && IsOnUsb(all->pv))
            return true;
    }
    return false;
}

// Returns whether the kernel has a device on top of it that is not a volume of its own group.
bool IsHeldByOthers(const LVMPV &pv)
{
    const std::string text = tavo::HoldersOf(tavo::LastPart(pv.szPv));
    for (const std::string_view holder : tavo::SplitFields(text)) {
        const auto name = tavo::KernelText("/sys/class/block/" + std::string(holder) + "/dm/name");
        const auto volume = name ? tavo::ParseVolumePath("/dev/mapper/" + *name) : std::nullopt;
        if (name ? !volume || volume->group != tavo::LastPart(pv.szVg) : !holder.starts_with("dm-"))
            return true;
    }
    return false;
}

bool IsInUse(const LVMPV &pv)
{
    if (tavo::IsGroupPath(pv.szVg) && IsMounted(pv.szVg))
        LogError("%s:%d %s is in use: %s is mounted", pv.szPv, pv.szVg);
    else if (IsHeldByOthers(pv))
        LogError("%s:%d %s is in use", pv.szPv);
    else
        return false;
    return true;
}

bool Remove(const LVMPV &pv)
{
    if (tavo::IsGroupPath(pv.szVg) && LVMRemove(pv.szVg, "lv") != 0)
        return false;
    if (!tavo::HoldersOf(tavo::LastPart(pv.szPv)).empty()) {
        LogError("%s:%d %s is in use", pv.szPv);
        return false;
    }
    return LVMPvRemove(pv.szPv) == 0;
}

// How many were removed; -1.
int Pass()
{
    LVMPVLIST *all = nullptr;
    if (LVMPvScan() != 0 || LVMPvSBEnum(&all) < 0)
        return -1;
    const std::unique_ptr<LVMPVLIST, decltype(&LVMPvSBListFree)> owner(all, LVMPvSBListFree);
    std::vector<const LVMPV *> illegal;
    for (const LVMPVLIST *node = all; node; node = node->pNext) {
        if (!IsOnDisk(node->pv))
            continue;
        if (IsForeign(all, node->pv))
            LogDebug("%s:%d %s stays: it is on a USB disk, or of a group that is", node->pv.szPv);
        else
            illegal.push_back(&node->pv);
    }
    for (const LVMPV *pv : illegal) {
        if (IsInUse(*pv))
            return -1;
    }
    int removed = 0;
    for (const LVMPV *pv : illegal)
        removed += Remove(*pv) ? 1 : 0;
    return removed;
}

}  // namespace

extern "C" int LVMCleanIllegal(void)
{
    if (LVMIsSupport() != 1)
        return 0;
    return Guard([] {
        constexpr int most_passes = 64;  // a tool that claims success and removes nothing must not keep us here
        for (int pass = 0; pass < most_passes; ++pass) {
            const int removed = Pass();
            if (removed <= 0)
                return removed;
        }
        return 0;
    });
}
