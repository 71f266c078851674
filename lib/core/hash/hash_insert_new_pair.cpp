// Adds the pair of a new key.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" TLIBSZHASH *PshTLIBIInsertNewPair(TLIBSZHASH *pHash, int *pSlot, const char *szKey, const char *szValue)
{
    if (!pHash || !pSlot || !szKey || !szValue)
        return nullptr;
    const int free_slot = tavo::FindPlace(pHash, szKey).Slot();
    if (free_slot >= 0 && tavo::IsPair(pHash->slots[free_slot]))
        return nullptr;
    const int slot = tavo::InsertNewPair(&pHash, free_slot, szKey, szValue);
    if (slot < 0)
        return nullptr;
    *pSlot = slot;
    return pHash;
}
