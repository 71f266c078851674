// Finds which items of one list are in another, for intersection, union and difference.
#ifndef TAVO_CORE_DETAIL_LIST_MATCH_H
#define TAVO_CORE_DETAIL_LIST_MATCH_H

#include "tavo_list.h"

namespace tavo {

// Two sorted lists can only be matched when they are sorted the same way.
bool CanMatch(const TLIBSZLIST *a, const TLIBSZLIST *b) noexcept;

// Checks the items of one list, one after the other, for being in another list.
class Matcher {
  public:
    // `mode` is the order that items are compared by; any but the two sorted ones means bytewise.
    enum class Search { linear, binary, merge };
    Matcher(const TLIBSZLIST *list, int mode, Search search) : list_(list), mode_(mode), search_(search) {}

    bool Has(const char *item) noexcept;

  private:
    bool HasByScan(const char *item) const noexcept;
    bool HasByWalk(const char *item) noexcept;

    const TLIBSZLIST *list_;
    int mode_;
    Search search_;
    int walked_ = 0;
};

// Selects the items of `a` that are in `b` (with `found` false: those that are not), into a new list or in `a` itself.
// NULL when memory runs out; `a` is then unchanged.
TLIBSZLIST *SelectItems(TLIBSZLIST *a, const TLIBSZLIST *b, bool in_new_list, bool found) noexcept;

}  // namespace tavo

#endif
