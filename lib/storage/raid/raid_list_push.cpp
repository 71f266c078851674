// Appends an array to a list.
#include "tavo_raid.h"

#include "core/detail/fault.h"

#include <cstdlib>

extern "C" int RAIDListPush(RAIDLIST **ppList, RAIDINFO *pInfo)
{
    if (!ppList || !pInfo)
        return Fail(ERR_BAD_PARAMETERS);
    RAIDLIST *const node = static_cast<RAIDLIST *>(std::malloc(sizeof(RAIDLIST)));
    if (!node)
        return Fail(ERR_OUT_OF_MEMORY);
    *node = {pInfo, nullptr};
    while (*ppList)
        ppList = &(*ppList)->pNext;
    *ppList = node;
    return 0;
}
