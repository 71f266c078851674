// Finds which items of one list are in another.
#include "core/detail/list_match.h"

#include "core/detail/folded_text.h"
#include "core/detail/list_block.h"

#include <cstring>

namespace tavo {
namespace {

Matcher SearchIn(const TLIBSZLIST *b, const TLIBSZLIST *for_items_of)
{
    if (!IsSorted(b))
        return Matcher(b, TLIB_SZLIST_UNSORTED, Matcher::Search::linear);
    return Matcher(b, b->fMode, IsSorted(for_items_of) ? Matcher::Search::merge : Matcher::Search::binary);
}

TLIBSZLIST *SelectIntoNewList(const TLIBSZLIST *a, const TLIBSZLIST *b, bool found)
{
    ListOwner selected(NewList(UsedBytes(a)));
    if (!selected)
        return nullptr;
    Matcher in_b = SearchIn(b, a);
    for (int i = 0; i < a->nItem; ++i) {
        if (!IsHole(a, i) && in_b.Has(a->pszItem[i]) == found)
            AppendItem(selected.Get(), a->pszItem[i]);
    }
    if (IsSorted(a))
        selected->fMode = a->fMode;
    return selected.Release();
}

}  // namespace

bool CanMatch(const TLIBSZLIST *a, const TLIBSZLIST *b) noexcept
{
    const int modes = a->fMode | b->fMode;
    return (!IsSorted(a) || !IsSorted(b) || a->fMode == b->fMode) && CanOrder(a, modes) && CanOrder(b, modes);
}

bool Matcher::Has(const char *item) noexcept
{
    switch (search_) {
    case Search::binary:
        return TLIBISzListFind(list_, list_->nItem - 1, 0, item, mode_ == TLIB_SZLIST_CASESORTED) >= 0;
    case Search::merge:
        return HasByWalk(item);
    case Search::linear:
        break;
    }
    return HasByScan(item);
}

bool Matcher::HasByScan(const char *item) const noexcept
{
    const auto compare = mode_ == TLIB_SZLIST_CASESORTED ? CompareFolded : std::strcmp;
    for (int i = 0; i < list_->nItem; ++i) {
        if (!IsHole(list_, i) && compare(item, list_->pszItem[i]) == 0)
            return true;
    }
    return false;
}

bool Matcher::HasByWalk(const char *item) noexcept
{
    const auto compare = mode_ == TLIB_SZLIST_CASESORTED ? OrderFolded : std::strcmp;
    for (; walked_ < list_->nItem; ++walked_) {
        const int order = IsHole(list_, walked_) ? 1 : compare(item, list_->pszItem[walked_]);
        if (order <= 0)
            return order == 0;
    }
    return false;
}

TLIBSZLIST *SelectItems(TLIBSZLIST *a, const TLIBSZLIST *b, bool in_new_list, bool found) noexcept
{
    if (in_new_list)
        return SelectIntoNewList(a, b, found);
    // If both are the same list, it would be searched while it shrinks.
    ListOwner copy;
    if (a == b) {
        copy.Reset(CopyList(b, b->nSize));
        if (!copy)
            return nullptr;
        b = copy.Get();
    }
    TLIBISzListClean(a);
    Matcher in_b = SearchIn(b, a);
    int kept = 0;
    for (int i = 0; i < a->nItem; ++i) {
        if (in_b.Has(a->pszItem[i]) == found)
            a->pszItem[kept++] = a->pszItem[i];
    }
    a->nFree += kListSlot * (a->nItem - kept);
    a->nItem = kept;
    return a;
}

}  // namespace tavo
