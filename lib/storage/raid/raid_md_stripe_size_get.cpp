// Computes the stripe size of an array.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_name.h"
#include "storage/detail/kernel_text.h"

#include <memory>

namespace {

// The members of a stripe that hold data; 0 where there are no stripes, -1 for another level.
int DataMembers(const RAIDINFO &info)
{
    switch (info.fLevel) {
    case RAID_LEVEL_1:
    case RAID_LEVEL_LINEAR:
        return 0;
    case RAID_LEVEL_0:
        return info.nSlot;
    case RAID_LEVEL_5:
        return info.nSlot - 1;
    case RAID_LEVEL_6:
        return info.nSlot - 2;
    default:
        LogError("%s:%d unknown raid type [%d]", info.fLevel);
        return -1;
    }
}

}  // namespace

extern "C" int RAIDMdStripeSizeGet(const char *szPath)
{
    return Guard([&] {
        RAIDINFO *info = nullptr;
        const int result = RAIDInfoGet(szPath, &info);
        const std::unique_ptr<RAIDINFO, decltype(&RAIDInfoFree)> owner(info, RAIDInfoFree);
        if (result != 1)
            return result == 0 ? Fail(ERR_OPEN_FAILED) : -1;
        const int members = DataMembers(*info);
        if (members <= 0)
            return members;
        const auto chunk = tavo::KernelNumber(tavo::ArrayFile(info->nArray, "md/chunk_size"));
        if (!chunk)
            return Fail(ERR_OPEN_FAILED);
        return static_cast<int>(*chunk * static_cast<unsigned>(members) >> 10);
    });
}
