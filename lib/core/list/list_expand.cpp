// Moves a list to a block of twice the size.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/list_block.h"

extern "C" TLIBSZLIST *PslTLIBISzListExpand(TLIBSZLIST *pList)
{
    if (!tavo::IsListBlock(pList))
        return FailNull(ERR_BAD_PARAMETERS);
    TLIBSZLIST *expanded = tavo::CopyList(pList, int64_t{2} * pList->nSize);
    if (!expanded)
        return FailNull(ERR_OUT_OF_MEMORY, Line{42});
    TLIBSzListFree(pList);
    return expanded;
}
