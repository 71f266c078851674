// The block of a string list: how large it is, how it is created, how it grows.
//
// Sizes are counted as on the appliance, where a pointer has four bytes: a list is full at the same item on every
// machine. Where pointers are wider, the block is physically larger by the extra size of the header and of a full
// table.
#ifndef TAVO_CORE_DETAIL_LIST_BLOCK_H
#define TAVO_CORE_DETAIL_LIST_BLOCK_H

#include "tavo_list.h"

#include "core/detail/list_owner.h"

#include <cstddef>
#include <cstdint>

namespace tavo {

constexpr int kListHeader = 24;
constexpr int kListSlot = 4;
constexpr int kListMinimum = 512;

constexpr size_t ListBlockBytes(int32_t size)
{
    const size_t wider_header = offsetof(TLIBSZLIST, pszItem) - kListHeader;
    const size_t wider_slot = sizeof(char *) - kListSlot;
    return static_cast<size_t>(size) + wider_header +
           wider_slot * static_cast<size_t>((size - kListHeader) / kListSlot);
}

// False for a block that was never created or has been overwritten: it cannot grow, since twice nothing is nothing.
inline bool IsListBlock(const TLIBSZLIST *list)
{
    return list && list->nSize >= kListHeader;
}

inline char *ListEnd(const TLIBSZLIST *list)
{
    return list->pszEmpty + 1;
}

inline int64_t UsedBytes(const TLIBSZLIST *list)
{
    return int64_t{list->nSize} - list->nFree;
}

inline bool IsHole(const TLIBSZLIST *list, int i)
{
    return list->pszItem[i] == list->pszEmpty;
}

inline bool IsSorted(const TLIBSZLIST *list)
{
    return list->fMode == TLIB_SZLIST_SORTED || list->fMode == TLIB_SZLIST_CASESORTED;
}

inline bool HasItem(const TLIBSZLIST *list, int i)
{
    return list && i >= 0 && i < list->nItem;
}

// Creates an empty list of that size (at least kListMinimum); NULL when memory runs out or the size exceeds 31 bits.
TLIBSZLIST *NewList(int64_t size) noexcept;

// Copies mode and items to a new block of that size, which must hold them; removed strings are not copied.
TLIBSZLIST *CopyList(const TLIBSZLIST *list, int64_t size) noexcept;

// Doubles the list until `bytes` are free. Moves the old block to `left`, because the string to be added may be in it.
// False, and nothing changed, when there is no memory.
bool MakeListRoom(TLIBSZLIST **list, int64_t bytes, ListOwner &left) noexcept;

// Copies the string (`length` bytes and a NUL) below the stored ones and counts it; there must be room.
char *StoreString(TLIBSZLIST *list, const char *string, size_t length) noexcept;

// Adds the string as the last item, whatever the mode; there must be room.
void AppendItem(TLIBSZLIST *list, const char *string) noexcept;

// False when comparing `string` with items, or the items with each other as `mode` says, needs tables that cannot be
// loaded. To be asked before the list is changed.
bool CanPlace(const TLIBSZLIST *list, const char *string) noexcept;
bool CanOrder(const TLIBSZLIST *list, int mode) noexcept;

// Sorts the items by the order of the mode.
void SortItems(TLIBSZLIST *list, int mode) noexcept;

}  // namespace tavo

#endif
