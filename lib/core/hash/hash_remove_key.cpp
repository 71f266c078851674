// Removes a key.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" char *SzTLIBSzHashRemoveKey(TLIBSZHASH *pHash, const char *szKey)
{
    const int slot = pHash && szKey ? tavo::FindPair(pHash, szKey) : -1;
    if (slot < 0)
        return nullptr;
    pHash->slots[slot].pszKey = nullptr;
    --pHash->nPair;
    return pHash->slots[slot].pszValue;
}
