// Appends a physical volume to a list.
#include "tavo_lvm.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>

extern "C" int LVMPvSBListPush(LVMPVLIST **ppList, const LVMPV *pPv)
{
    if (!ppList || !pPv) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    LVMPVLIST *const node = static_cast<LVMPVLIST *>(std::malloc(sizeof(LVMPVLIST)));
    if (!node) {
        LogError("%s:%d Failed to calloc for '%s', errno=%s", pPv->szPv, std::strerror(ENOMEM));
        return Fail(ERR_OUT_OF_MEMORY);
    }
    *node = {*pPv, nullptr};
    while (*ppList)
        ppList = &(*ppList)->pNext;
    *ppList = node;
    return 0;
}
