// Finds a string in a list without regard to case.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/folded_text.h"
#include "core/detail/list_block.h"

#include <algorithm>

extern "C" int TLIBSzListCaseFind(const TLIBSZLIST *pList, const char *sz)
{
    if (!pList || !sz || pList->fMode == TLIB_SZLIST_SORTED)
        return Fail(ERR_BAD_PARAMETERS, Line{46});
    if (pList->fMode == TLIB_SZLIST_CASESORTED)
        return std::max(-1, TLIBISzListFind(pList, pList->nItem - 1, 0, sz, 1));
    for (int i = 0; i < pList->nItem; ++i) {
        if (!tavo::IsHole(pList, i) && tavo::CompareFolded(pList->pszItem[i], sz) == 0)
            return i;
    }
    return -1;
}
