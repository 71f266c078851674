// Finds a string in a list by bytes, and the binary search that sorted lists share.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/folded_text.h"
#include "core/detail/list_block.h"

#include <algorithm>
#include <cstring>

extern "C" int TLIBISzListFind(const TLIBSZLIST *pList, int hi, int lo, const char *sz, int fCase)
{
    if (!pList || !sz)
        return Fail(ERR_BAD_PARAMETERS);
    if (hi == -1)
        return -1;
    hi = std::min(hi, pList->nItem - 1);
    lo = std::clamp(lo, 0, pList->nItem);
    while (lo <= hi) {
        const int mid = lo + (hi - lo) / 2;
        const int order = fCase ? tavo::CompareFolded(sz, pList->pszItem[mid]) : std::strcmp(sz, pList->pszItem[mid]);
        if (order == 0)
            return mid;
        if (fCase && order == -2)
            break;
        if (order < 0)
            hi = mid - 1;
        else
            lo = mid + 1;
    }
    return -(lo + 1);
}

extern "C" int TLIBSzListFind(const TLIBSZLIST *pList, const char *sz)
{
    if (!pList || !sz || pList->fMode == TLIB_SZLIST_CASESORTED)
        return Fail(ERR_BAD_PARAMETERS, Line{37});
    if (pList->fMode == TLIB_SZLIST_SORTED)
        return std::max(-1, TLIBISzListFind(pList, pList->nItem - 1, 0, sz, 0));
    for (int i = 0; i < pList->nItem; ++i) {
        if (!tavo::IsHole(pList, i) && std::strcmp(pList->pszItem[i], sz) == 0)
            return i;
    }
    return -1;
}
