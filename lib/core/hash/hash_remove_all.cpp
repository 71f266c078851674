// Removes every key and keeps the block.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" void PslSzHashRemoveAll(TLIBSZHASH *pHash)
{
    if (!pHash)
        return;
    for (int slot = 0; slot < pHash->nSlot; ++slot)
        pHash->slots[slot].pszKey = nullptr;
    pHash->nPair = 0;
    pHash->nStrFree = pHash->nStrSize;
    pHash->pszNextStr = tavo::StringArea(pHash);
}
