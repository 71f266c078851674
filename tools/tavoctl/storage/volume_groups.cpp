// Volume groups.
#include "storage/volume_groups.h"

#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/files.h"
#include "frame/lists.h"
#include "storage/device.h"

namespace tavoctl {
std::vector<LVMPV> PhysicalVolumes()
{
    LVMPVLIST *list = nullptr;
    Must(LVMPvSBEnum(&list) >= 0, "list the physical volumes", log_hint);
    const std::unique_ptr<LVMPVLIST, By<LVMPvSBListFree>> owner(list);
    std::vector<LVMPV> volumes;
    for (const LVMPVLIST *node = list; node; node = node->pNext)
        volumes.push_back(node->pv);
    return volumes;
}

std::vector<std::string> DevicesOf(const std::string &group)
{
    std::vector<std::string> devices;
    for (const LVMPV &pv : PhysicalVolumes())
        if (group == pv.szVg)
            devices.emplace_back(pv.szPv);
    return devices;
}

void RefuseWithoutLvm(const std::string &attempted)
{
    FailIf(LVMIsSupport() != 1, attempted, "this model has no RAID and no volumes");
}

LVMVG ReadVg(const std::string &path, const std::string &attempted)
{
    RefuseWithoutLvm(attempted);
    LVMVG group;
    const int found = LVMVgSBGet(path.c_str(), &group);
    Must(found >= 0, attempted, log_hint);
    if (found == 0)
        throw NotFound(attempted, ERR_NO_VOLUME_ID, "tavoctl lvm list shows what is there");
    return group;
}

VolumeGroup ReadVgInfo(const std::string &path, const std::string &attempted)
{
    const LVMVG found = ReadVg(path, attempted);
    VolumeGroup record(LVMVgInfoAlloc());
    Must(record && LVMVgSB2Info(&found, record.get()) == 0, attempted, log_hint);
    FailIf(record->nPv == 0, attempted, "it has no physical volumes");
    return record;
}

void RefuseUsedGroup(const std::string &path, const std::string &attempted)
{
    for (const std::string &volume : FolderNames(path))
        if (const std::string use = UseOf(path + '/' + volume); !use.empty())
            throw BusyFailure(attempted, use, "free it first");
}

void RefuseGrouped(const std::vector<std::string> &devices, const std::string &attempted)
{
    for (const LVMPV &pv : PhysicalVolumes())
        BusyIf(*pv.szVg && Contains(devices, pv.szPv), attempted, std::string(pv.szPv) + " belongs to " + pv.szVg,
               "remove that first");
}

}  // namespace tavoctl
