// Counts the keys, and lists them.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" int TLIBSzHashEnumKey(const TLIBSZHASH *pHash, TLIBSZLIST **ppList)
{
    if (!pHash)
        return -1;
    int count = 0;
    for (int slot = 0; slot < pHash->nSlot && count < pHash->nPair; ++slot) {
        if (!tavo::IsPair(pHash->slots[slot]))
            continue;
        if (ppList && TLIBSzListPush(ppList, pHash->slots[slot].pszKey) < 0)
            return -1;
        ++count;
    }
    return count;
}
