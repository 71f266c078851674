// Replaces one item of a list.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/list_block.h"

#include <cstring>

extern "C" int TLIBSzListSet(TLIBSZLIST **ppList, int i, const char *sz)
{
    if (!ppList || !tavo::IsListBlock(*ppList) || !tavo::HasItem(*ppList, i) || !sz)
        return Fail(ERR_BAD_PARAMETERS);
    if (tavo::IsSorted(*ppList) && !(tavo::CanOrder(*ppList, (*ppList)->fMode) && tavo::CanPlace(*ppList, sz)))
        return Fail(ERR_BAD_PARAMETERS);
    const size_t length = std::strlen(sz);
    // In place, the new text overwrites the old one. A hole has no text, so only "" is ever written to the empty string
    // that all holes share.
    if (length > std::strlen((*ppList)->pszItem[i])) {
        tavo::ListOwner left;
        if (!tavo::MakeListRoom(ppList, static_cast<int64_t>(length) + 1, left))
            return Fail(ERR_OUT_OF_MEMORY);
        (*ppList)->pszItem[i] = tavo::StoreString(*ppList, sz, length);
    } else {
        std::memmove((*ppList)->pszItem[i], sz, length + 1);
    }
    TLIBSZLIST *list = *ppList;
    if (!tavo::IsSorted(list))
        return i;
    const char *stored = list->pszItem[i];
    tavo::SortItems(list, list->fMode);
    // In a list sorted without regard to case this fails after the item has been replaced; callers rely on that.
    return TLIBSzListFind(list, stored);
}
