// Copies an array record.
#include "tavo_raid.h"

#include "core/detail/fault.h"
#include "storage/detail/array_members.h"

#include <cstdlib>

namespace {

bool CopyMembers(const RAIDMEMBER *from, RAIDMEMBER **to)
{
    *to = nullptr;
    for (; from; from = from->pNext, to = &(*to)->pNext) {
        *to = static_cast<RAIDMEMBER *>(std::malloc(sizeof(RAIDMEMBER)));
        if (!*to)
            return false;
        **to = *from;
        (*to)->pNext = nullptr;
    }
    return true;
}

}  // namespace

extern "C" RAIDINFO *RAIDInfoDup(const RAIDINFO *pInfo)
{
    if (!pInfo)
        return FailNull(ERR_BAD_PARAMETERS);
    RAIDINFO *const copy = static_cast<RAIDINFO *>(std::malloc(sizeof(RAIDINFO)));
    if (!copy)
        return FailNull(ERR_OUT_OF_MEMORY);
    *copy = *pInfo;
    if (!CopyMembers(pInfo->pMembers, &copy->pMembers)) {
        RAIDInfoFree(copy);
        return FailNull(ERR_OUT_OF_MEMORY);
    }
    return copy;
}
