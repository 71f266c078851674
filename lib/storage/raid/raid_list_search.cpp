// Finds an array in a list by its path.
#include "tavo_raid.h"

#include "core/detail/fault.h"

#include <cstring>

extern "C" int RAIDListSearch(const RAIDLIST *pList, const char *szPath, RAIDINFO **ppInfo)
{
    if (!szPath || !ppInfo)
        return Fail(ERR_BAD_PARAMETERS);
    for (; pList; pList = pList->pNext) {
        if (pList->pInfo && std::strcmp(pList->pInfo->szPath, szPath) == 0) {
            *ppInfo = pList->pInfo;
            return 1;
        }
    }
    return 0;
}
