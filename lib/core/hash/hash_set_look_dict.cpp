// Finds the slot of a key for writing.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" int TLIBISetLookDict(const TLIBSZHASH *pHash, const char *szKey)
{
    return pHash && szKey ? tavo::FindPlace(pHash, szKey).usual : -1;
}
