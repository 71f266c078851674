// Removes physical volumes that are on no array.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/mount_table.h"
#include "storage/detail/volume_name.h"

#include <memory>

#include <glob.h>

namespace {

bool IsMounted(std::string_view group)
{
    std::vector<tavo::Mount> mounts;
    if (!tavo::ReadMounts(mounts))
        return true;  // nobody knows
    for (const tavo::Mount &mount : mounts) {
        const auto source = tavo::ParseVolumePath(mount.source);
        if (source && tavo::LastPart(group) == source->group)
            return true;
    }
    return false;
}

// Whether the kernel has a device on top of it: an active volume, of whatever group.
bool IsHeld(const char *device)
{
    const std::string pattern = "/sys/class/block/" + std::string(tavo::LastPart(device)) + "/holders/*";
    glob_t found = {};
    const int error = ::glob(pattern.c_str(), 0, nullptr, &found);
    ::globfree(&found);
    return error != GLOB_NOMATCH;
}

bool Remove(const LVMPV &pv)
{
    const bool has_group = tavo::IsGroupPath(pv.szVg);
    if (has_group && IsMounted(pv.szVg)) {
        LogError("%s:%d %s is in use: %s is mounted", pv.szPv, pv.szVg);
        return false;
    }
    if (has_group && LVMRemove(pv.szVg, "lv") != 0)
        return false;
    if (IsHeld(pv.szPv)) {
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
    int removed = 0;
    for (const LVMPVLIST *node = all; node; node = node->pNext) {
        if (std::string_view(node->pv.szPv).starts_with("/dev/sd") && Remove(node->pv))
            ++removed;
    }
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
