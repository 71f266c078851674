// The block of a string list: how it is created, how it grows.
#include "core/detail/list_block.h"

#include "core/detail/folded_text.h"

#include <algorithm>
#include <climits>
#include <cstdlib>
#include <cstring>

namespace tavo {
namespace {

int64_t StoredBytes(const TLIBSZLIST *list)
{
    int64_t bytes = 0;
    for (int i = 0; i < list->nItem; ++i)
        bytes += IsHole(list, i) ? 0 : static_cast<int64_t>(std::strlen(list->pszItem[i])) + 1;
    return bytes;
}

}  // namespace

TLIBSZLIST *NewList(int64_t size) noexcept
{
    if (size < kListMinimum)
        size = kListMinimum;
    if (size > INT_MAX)
        return nullptr;
    const auto counted = static_cast<int32_t>(size);
    const size_t bytes = ListBlockBytes(counted);
    auto *list = static_cast<TLIBSZLIST *>(std::malloc(bytes));
    if (!list)
        return nullptr;
    char *end = reinterpret_cast<char *>(list) + bytes;
    end[-1] = '\0';
    list->nSize = counted;
    list->nItem = 0;
    list->nFree = counted - kListHeader;
    list->fMode = TLIB_SZLIST_UNSORTED;
    list->EndofFree = end;
    list->pszEmpty = end - 1;
    return list;
}

TLIBSZLIST *CopyList(const TLIBSZLIST *list, int64_t size) noexcept
{
    TLIBSZLIST *copy = NewList(size);
    if (!copy)
        return nullptr;
    copy->fMode = list->fMode;
    copy->nItem = list->nItem;
    copy->nFree -= kListSlot * list->nItem;
    for (int i = 0; i < list->nItem; ++i) {
        const char *item = list->pszItem[i];
        copy->pszItem[i] = IsHole(list, i) ? copy->pszEmpty : StoreString(copy, item, std::strlen(item));
    }
    return copy;
}

bool MakeListRoom(TLIBSZLIST **list, int64_t bytes, ListOwner &left) noexcept
{
    if ((*list)->nFree >= bytes)
        return true;
    const int64_t used = kListHeader + int64_t{kListSlot} * (*list)->nItem + StoredBytes(*list);
    int64_t size = (*list)->nSize;
    do {
        size *= 2;
    } while (size - used < bytes && size <= INT_MAX);
    TLIBSZLIST *grown = CopyList(*list, size);
    if (!grown)
        return false;
    left.Reset(*list);
    *list = grown;
    return true;
}

char *StoreString(TLIBSZLIST *list, const char *string, size_t length) noexcept
{
    list->EndofFree -= length + 1;
    list->nFree -= static_cast<int32_t>(length + 1);
    // The string may be one that this list stored and removed.
    std::memmove(list->EndofFree, string, length);
    list->EndofFree[length] = '\0';
    return list->EndofFree;
}

void AppendItem(TLIBSZLIST *list, const char *string) noexcept
{
    list->pszItem[list->nItem++] = StoreString(list, string, std::strlen(string));
    list->nFree -= kListSlot;
}

bool CanPlace(const TLIBSZLIST *list, const char *string) noexcept
{
    return list->fMode != TLIB_SZLIST_CASESORTED || CanFold(string);
}

bool CanOrder(const TLIBSZLIST *list, int mode) noexcept
{
    const bool folds = !(mode & TLIB_SZLIST_SORTED) && (mode & TLIB_SZLIST_CASESORTED);
    return !folds || std::all_of(list->pszItem, list->pszItem + list->nItem, CanFold);
}

void SortItems(TLIBSZLIST *list, int mode) noexcept
{
    if (mode & TLIB_SZLIST_SORTED)
        std::qsort(list->pszItem, static_cast<size_t>(list->nItem), sizeof(char *), TLIBISzListStrcmp);
    else if (mode & TLIB_SZLIST_CASESORTED)
        std::qsort(list->pszItem, static_cast<size_t>(list->nItem), sizeof(char *), TLIBISzListUTF8StrCasecmp);
}

}  // namespace tavo
