// Sorts a list, or relabels one that has been sorted before.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/list_block.h"

extern "C" void TLIBSzListSortItems(TLIBSZLIST *pList, int mode)
{
    if (!pList)
        return;
    // Callers label lists that they filled in order themselves; sorting those again would only cost time.
    if (pList->fMode == TLIB_SZLIST_UNSORTED && (mode & (TLIB_SZLIST_SORTED | TLIB_SZLIST_CASESORTED))) {
        if (!tavo::CanOrder(pList, mode)) {
            Fail(ERR_BAD_PARAMETERS);
            return;
        }
        TLIBISzListClean(pList);
        tavo::SortItems(pList, mode);
    }
    pList->fMode = mode;
}
