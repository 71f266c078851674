// Keeps the items of a list that are also in another list.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/list_block.h"
#include "core/detail/list_match.h"

extern "C" TLIBSZLIST *PslTLIBSzListAnd(TLIBSZLIST *pA, const TLIBSZLIST *pB, int fFlags)
{
    if (!tavo::IsListBlock(pA) || !tavo::IsListBlock(pB))
        return FailNull(ERR_BAD_PARAMETERS, Line{59});
    if (!tavo::CanMatch(pA, pB))
        return FailNull(ERR_BAD_PARAMETERS, Line{69});
    if (fFlags & ~TLIB_SZLIST_NEW)
        return FailNull(ERR_BAD_PARAMETERS);
    TLIBSZLIST *selected = tavo::SelectItems(pA, pB, fFlags == TLIB_SZLIST_NEW, true);
    return selected ? selected : FailNull(ERR_OUT_OF_MEMORY);
}
