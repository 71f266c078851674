// The hash function.
#include "tavo_hash.h"

#include "core/detail/hash_slot.h"

extern "C" int TLIBIRadixHashCode(const char *szKey, int nSlot)
{
    return szKey ? tavo::HomeSlot(szKey, nSlot) : -1;
}
