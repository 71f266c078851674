// Reads all disks of the internal bays and of the expansion units.
#include "tavo_appliance.h"
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/model_setting.h"
#include "core/detail/owner.h"
#include "storage/detail/disk_path.h"
#include "storage/detail/open_disk.h"

#include <memory>

namespace {

class Gathered {
  public:
    // Returns false when memory ran out. An empty bay or slot is not a failure, and neither is a disk that cannot be
    // read.
    bool Add(const char *path)
    {
        if (!tavo::HasNode(path))
            return true;
        DISKINFO *info = nullptr;
        const int result = DiskInfoGet(path, &info);
        if (result < 0)
            LogError("%s:%d Failed to get disk information %s", path);
        if (result <= 0)
            return true;
        DISKLIST *list = list_.release();
        const bool pushed = DiskListPush(&list, info) == 0;
        list_.reset(list);
        if (!pushed)
            DiskInfoFree(info);
        count_ += pushed ? 1 : 0;
        return pushed;
    }

    int Count() const { return count_; }
    DISKLIST *Release() { return list_.release(); }

  private:
    std::unique_ptr<DISKLIST, tavo::FreedBy<DiskInfoEnumFree>> list_;
    int count_ = 0;
};

bool ScanBays(Gathered &disks)
{
    const int bays = TAVOMaxDiskGet();
    for (int i = 0; i < bays && i < 26; ++i) {
        if (TAVOEBoxDevIs(i) != 1 && !disks.Add(tavo::PortDevice(i).c_str()))
            return false;
    }
    return true;
}

bool ScanUnits(Gathered &disks)
{
    if (!tavo::ModelHas("supportebox"))
        return true;
    TAVOEBOX *boxes = nullptr;
    const int count = TAVOEBoxInfoEnum(&boxes);
    const tavo::HeapBlock<TAVOEBOX> owner(boxes);
    if (count < 0) {
        LogError("%s:%d Failed to enum ebox, errno=0x%X", TLIBErrGet());
        return false;
    }
    for (int unit = 0; unit < count; ++unit) {
        const TAVOEBOX &box = boxes[unit];
        for (int i = 0; TAVOEBoxIsPoweron(&box) == 1 && i < box.nDisk; ++i) {
            if (!disks.Add(box.rgszDisk[i]))
                return false;
        }
    }
    return true;
}

}  // namespace

extern "C" int DiskInfoEnum(const int *pFilter, DISKLIST **ppList)
{
    if (!ppList)
        return Fail(ERR_BAD_PARAMETERS);
    *ppList = nullptr;
    const int wanted = pFilter && *pFilter ? *pFilter : DISK_ENUM_INTERNAL | DISK_ENUM_UNITS;
    return Guard([&] {
        Gathered disks;
        const bool bays = (wanted & DISK_ENUM_INTERNAL) == 0 || ScanBays(disks);
        const bool units = (wanted & DISK_ENUM_UNITS) == 0 || ScanUnits(disks);
        if (!bays || !units)
            return -1;
        *ppList = disks.Release();
        return disks.Count();
    });
}
