// Stores a new pair in a free slot.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" int TLIBIInsertPair(TLIBSZHASH *pHash, int slot, const char *szKey, const char *szValue)
{
    if (!pHash || !szKey || !szValue || slot < 0 || slot >= pHash->nSlot || tavo::IsPair(pHash->slots[slot]))
        return -1;
    if (tavo::PairBytes(szKey, szValue) > pHash->nStrFree || !tavo::StorePair(pHash, slot, szKey, szValue))
        return -1;
    return slot;
}
