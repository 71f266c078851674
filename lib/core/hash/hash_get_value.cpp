// Reads the value of a key.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" char *SzTLIBSzHashGetValue(const TLIBSZHASH *pHash, const char *szKey)
{
    const int slot = pHash && szKey ? tavo::FindPair(pHash, szKey) : -1;
    return slot < 0 ? nullptr : pHash->slots[slot].pszValue;
}
