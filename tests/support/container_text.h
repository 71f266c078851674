// Lists and hashes as values that tests write down, compare and print.
#ifndef TESTS_SUPPORT_CONTAINER_TEXT_H
#define TESTS_SUPPORT_CONTAINER_TEXT_H

#include "tavo_hash.h"
#include "tavo_list.h"

#include "support/test.h"

namespace test {

struct FreeContainer {
    void operator()(TLIBSZLIST *list) const { TLIBSzListFree(list); }
    void operator()(TLIBSZHASH *hash) const { TLIBSzHashFree(hash); }
};
using List = std::unique_ptr<TLIBSZLIST, FreeContainer>;
using Hash = std::unique_ptr<TLIBSZHASH, FreeContainer>;

// Calls a function that may move the block.
template <class Owner, class Call>
auto Moving(Owner &owner, Call call)
{
    auto *block = owner.release();
    auto result = call(&block);
    owner.reset(block);
    return result;
}

inline std::vector<std::string> Items(const TLIBSZLIST *list)
{
    return {list->pszItem, list->pszItem + list->nItem};
}

inline List MakeList(const std::vector<std::string> &items, int mode = 0)
{
    List list(PslTLIBSzListAlloc(0));
    for (const std::string &item : items)
        EXPECT_GE(Moving(list, [&](auto **addr) { return TLIBSzListPush(addr, item.c_str()); }), 0);
    if (mode)
        TLIBSzListSortItems(list.get(), mode);
    return list;
}

inline std::map<std::string, std::string> Pairs(const TLIBSZHASH *hash)
{
    std::map<std::string, std::string> pairs;
    for (int slot = 0; slot < hash->nSlot; ++slot) {
        if (hash->slots[slot].pszKey)
            pairs[hash->slots[slot].pszKey] = hash->slots[slot].pszValue;
    }
    return pairs;
}

}  // namespace test

#endif
