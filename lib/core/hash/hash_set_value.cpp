// Sets the value of a key.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" int TLIBSzHashSetValue(TLIBSZHASH **ppHash, const char *szKey, const char *szValue)
{
    if (!ppHash || !*ppHash || !szKey || !szValue)
        return -1;
    const std::string_view key(szKey);
    const int slot = tavo::FindPlace(*ppHash, key).Slot();
    if (slot >= 0 && tavo::IsPair((*ppHash)->slots[slot]))
        return tavo::UpdateValue(ppHash, slot, key, szValue);
    return tavo::InsertNewPair(ppHash, slot, key, szValue);
}
