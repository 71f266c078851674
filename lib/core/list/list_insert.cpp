// Inserts a string into a list: at an index, at the end, at the beginning.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/list_block.h"

#include <algorithm>
#include <cstring>

using tavo::kListSlot;

namespace {

int PlaceInOrder(const TLIBSZLIST *list, const char *string)
{
    const int fold = list->fMode == TLIB_SZLIST_CASESORTED;
    const int found = TLIBISzListFind(list, list->nItem - 1, 0, string, fold);
    return found < 0 ? -(found + 1) : found;
}

}  // namespace

extern "C" int TLIBSzListInsert(TLIBSZLIST **ppList, int i, const char *sz)
{
    if (!ppList || !tavo::IsListBlock(*ppList) || !sz || i < 0)
        return Fail(ERR_BAD_PARAMETERS, Line{45});
    if (!tavo::CanPlace(*ppList, sz))
        return Fail(ERR_BAD_PARAMETERS);
    const size_t length = std::strlen(sz);
    if (tavo::IsSorted(*ppList))
        i = PlaceInOrder(*ppList, sz);
    const int64_t holes = std::max<int64_t>(0, int64_t{i} - (*ppList)->nItem);
    const int64_t needed = static_cast<int64_t>(length) + 1 + kListSlot * (holes + 1);
    tavo::ListOwner left;
    if (!tavo::MakeListRoom(ppList, needed, left))
        return Fail(ERR_OUT_OF_MEMORY, Line{72});

    TLIBSZLIST *list = *ppList;
    char *stored = tavo::StoreString(list, sz, length);
    char **slot = list->pszItem + i;
    char **end = list->pszItem + list->nItem;
    if (slot < end)
        std::memmove(slot + 1, slot, static_cast<size_t>(end - slot) * sizeof *slot);
    else
        std::fill(end, slot, list->pszEmpty);
    *slot = stored;
    list->nItem = std::max(list->nItem, i) + 1;
    list->nFree -= static_cast<int32_t>(kListSlot * (holes + 1));
    return i;
}

extern "C" int TLIBSzListPush(TLIBSZLIST **ppList, const char *sz)
{
    if (!ppList || !tavo::IsListBlock(*ppList) || !sz)
        return Fail(ERR_BAD_PARAMETERS, Line{131});
    return TLIBSzListInsert(ppList, (*ppList)->nItem, sz);
}

extern "C" int TLIBSzListUnshift(TLIBSZLIST **ppList, const char *sz)
{
    if (!ppList || !tavo::IsListBlock(*ppList) || !sz)
        return Fail(ERR_BAD_PARAMETERS, Line{167});
    return TLIBSzListInsert(ppList, 0, sz);
}
