// Replaces the value of a key.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" TLIBSZHASH *PshTLIBIUpdateValue(TLIBSZHASH *pHash, int *pSlot, const char *szKey, const char *szValue)
{
    if (!pHash || !pSlot || !szKey || !szValue || *pSlot < 0 || *pSlot != tavo::FindPair(pHash, szKey))
        return nullptr;
    const int slot = tavo::UpdateValue(&pHash, *pSlot, szKey, szValue);
    if (slot < 0)
        return nullptr;
    *pSlot = slot;
    return pHash;
}
