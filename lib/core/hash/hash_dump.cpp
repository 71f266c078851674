// Prints a hash for debugging.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

#include <cstdio>

extern "C" void TLIBIHashDump(const TLIBSZHASH *pHash)
{
    if (!pHash)
        return;
    std::printf("%p start address \n", static_cast<const void *>(pHash));
    for (int slot = 0; slot < pHash->nSlot; ++slot) {
        const TLIBSZHASHSLOT &at = pHash->slots[slot];
        if (tavo::IsPair(at))
            std::printf("slots[%i] %s=%s\n", slot, at.pszKey, at.pszValue);
        else
            std::printf("slots[%i] %s\n", slot, tavo::IsNeverUsed(at) ? "empty" : "removed");
    }
    std::printf("nStrSize =%i \t nStrFree =%i \t nSlot =%i \t nPair =%i \t pszNextStr=%p\n", pHash->nStrSize,
                pHash->nStrFree, pHash->nSlot, pHash->nPair, static_cast<void *>(pHash->pszNextStr));
}
