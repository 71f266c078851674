// Moves a hash to a block of another size.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" TLIBSZHASH *PshTLIBIReSizeHash(TLIBSZHASH *pHash, int nSlot, int cbStr)
{
    TLIBSZHASH *resized = pHash ? tavo::CopyToNewHash(pHash, nSlot, cbStr) : nullptr;
    if (resized)
        TLIBSzHashFree(pHash);
    return resized;
}
