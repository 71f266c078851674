// Adds the pairs of one hash to another that is large enough.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" int TLIBICopyHash(TLIBSZHASH *pTo, const TLIBSZHASH *pFrom)
{
    if (!pTo || !pFrom)
        return -1;
    for (int slot = 0; slot < pFrom->nSlot; ++slot) {
        const TLIBSZHASHSLOT &pair = pFrom->slots[slot];
        if (!tavo::IsPair(pair))
            continue;
        const int to_slot = tavo::FindPlace(pTo, pair.pszKey).Slot();
        if (TLIBIInsertPair(pTo, to_slot, pair.pszKey, pair.pszValue) < 0)
            return -1;
    }
    return 0;
}
