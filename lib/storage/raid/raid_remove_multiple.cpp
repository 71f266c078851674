// Removes several arrays.
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"

#include <memory>

extern "C" int RAIDRemoveMultiple(const TLIBSZLIST *pslPaths)
{
    if (!pslPaths)
        return Fail(ERR_BAD_PARAMETERS);
    int result = 0;
    for (int i = 0; i < pslPaths->nItem; ++i) {
        RAIDINFO *info = nullptr;
        const int found = RAIDInfoGet(pslPaths->pszItem[i], &info);
        const std::unique_ptr<RAIDINFO, decltype(&RAIDInfoFree)> owner(info, RAIDInfoFree);
        if (found == 0 || (found == 1 && RAIDRemove(info) == 0))
            continue;
        LogError("%s:%d Failed to remove %s", pslPaths->pszItem[i]);
        result = -1;
    }
    return result;
}
