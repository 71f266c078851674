// Appends a disk to a list.
#include "tavo_disk.h"

#include "core/detail/fault.h"

#include <cstdlib>

extern "C" int DiskListPush(DISKLIST **ppList, DISKINFO *pInfo)
{
    if (!ppList || !pInfo)
        return Fail(ERR_BAD_PARAMETERS);
    DISKLIST *const node = static_cast<DISKLIST *>(std::malloc(sizeof(DISKLIST)));
    if (!node)
        return Fail(ERR_OUT_OF_MEMORY);
    *node = {pInfo, nullptr};
    while (*ppList)
        ppList = &(*ppList)->pNext;
    *ppList = node;
    return 0;
}
