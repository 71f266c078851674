// Adds to a list the items of another list that it lacks.
#include "tavo_list.h"

#include "core/detail/guard.h"
#include "core/detail/list_block.h"
#include "core/detail/list_match.h"

#include <cstring>
#include <vector>

namespace {

using tavo::Matcher;

// The items that are in `b` but not in `a`, found before anything is added, so that both forms of the union agree.
struct Missing {
    std::vector<const char *> items;
    int64_t bytes = 0;
};

Missing MissingItems(const TLIBSZLIST *a, const TLIBSZLIST *b)
{
    Missing missing;
    const bool walk = tavo::IsSorted(a) && tavo::IsSorted(b);
    Matcher in_a(a, b->fMode, walk ? Matcher::Search::merge : Matcher::Search::linear);
    for (int i = 0; i < b->nItem; ++i) {
        const char *item = b->pszItem[i];
        if (tavo::IsHole(b, i) || in_a.Has(item))
            continue;
        missing.items.push_back(item);
        missing.bytes += static_cast<int64_t>(std::strlen(item)) + 1 + tavo::kListSlot;
    }
    return missing;
}

// There is room for all of them.
void AddMissing(TLIBSZLIST *list, const Missing &missing)
{
    for (const char *item : missing.items)
        TLIBSzListPush(&list, item);
}

TLIBSZLIST *UnionInNewList(const TLIBSZLIST *a, const TLIBSZLIST *b)
{
    const Missing missing = MissingItems(a, b);
    tavo::ListOwner all(tavo::NewList(tavo::UsedBytes(a) + tavo::UsedBytes(b)));
    if (!all)
        return FailNull(ERR_OUT_OF_MEMORY);
    for (int i = 0; i < a->nItem; ++i) {
        if (!tavo::IsHole(a, i))
            tavo::AppendItem(all.Get(), a->pszItem[i]);
    }
    if (tavo::IsSorted(a))
        all->fMode = a->fMode;
    AddMissing(all.Get(), missing);
    return all.Release();
}

TLIBSZLIST *UnionInPlace(TLIBSZLIST **a, const TLIBSZLIST *b)
{
    TLIBISzListClean(*a);
    const Missing missing = MissingItems(*a, b);
    tavo::ListOwner left;
    if (!tavo::MakeListRoom(a, missing.bytes, left))
        return FailNull(ERR_OUT_OF_MEMORY);
    AddMissing(*a, missing);
    return *a;
}

}  // namespace

extern "C" TLIBSZLIST *PslTLIBSzListOr(TLIBSZLIST **ppA, const TLIBSZLIST *pB, int fFlags)
{
    if (!ppA || !tavo::IsListBlock(*ppA) || !tavo::IsListBlock(pB))
        return FailNull(ERR_BAD_PARAMETERS, Line{61});
    if (!tavo::CanMatch(*ppA, pB))
        return FailNull(ERR_BAD_PARAMETERS, Line{73});
    if (fFlags & ~TLIB_SZLIST_NEW)
        return FailNull(ERR_BAD_PARAMETERS);
    return Guard([&] { return fFlags == TLIB_SZLIST_NEW ? UnionInNewList(*ppA, pB) : UnionInPlace(ppA, pB); });
}
