// Finds the slot of a key for reading.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" int TLIBIGetLookDict(const TLIBSZHASH *pHash, const char *szKey)
{
    return pHash && szKey ? tavo::FindPair(pHash, szKey) : -1;
}
