// Makes an empty record of a volume group.
#include "tavo_lvm.h"

#include "core/detail/fault.h"

#include <cstdlib>

extern "C" LVMVGINFO *LVMVgInfoAlloc(void)
{
    constexpr int list_bytes = 128;
    LVMVGINFO *const info = static_cast<LVMVGINFO *>(std::calloc(1, sizeof(LVMVGINFO)));
    if (!info)
        return FailNull(ERR_OUT_OF_MEMORY);
    info->pslPvs = PslTLIBSzListAlloc(list_bytes);
    if (!info->pslPvs) {
        LVMVgInfoFree(info);
        return FailNull(ERR_OUT_OF_MEMORY);
    }
    return info;
}
