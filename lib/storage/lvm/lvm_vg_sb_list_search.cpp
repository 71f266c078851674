// Finds a volume group in a list.
#include "tavo_lvm.h"

#include "core/detail/log.h"

#include <cstring>

namespace {

bool Holds(const TLIBSZLIST *paths, const char *path)
{
    for (int i = 0; paths && i < paths->nItem; ++i) {
        if (std::strcmp(paths->pszItem[i], path) == 0)
            return true;
    }
    return false;
}

}  // namespace

extern "C" int LVMVgSBListSearch(const LVMVGLIST *pList, const LVMVGKEY *pKey, LVMVGINFO **ppFound)
{
    if (!pKey || !ppFound) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    for (; pList; pList = pList->pNext) {
        LVMVGINFO *const info = pList->pInfo;
        if (info && ((pKey->szVg && std::strcmp(info->szVg, pKey->szVg) == 0) ||
                     (pKey->szPv && Holds(info->pslPvs, pKey->szPv)))) {
            *ppFound = info;
            return 1;
        }
    }
    return 0;
}
