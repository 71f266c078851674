// Reads the superblocks of several members.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/owner.h"
#include "storage/detail/bounded_text.h"

extern "C" int RAIDSBEnum(const TLIBSZLIST *pslMembers, RAIDSBENTRY **ppEntry)
{
    if (!pslMembers || !ppEntry)
        return Fail(ERR_BAD_PARAMETERS);
    *ppEntry = nullptr;
    if (pslMembers->nItem == 0)
        return 0;
    tavo::HeapBlock<RAIDSBENTRY> entries(
        static_cast<RAIDSBENTRY *>(std::calloc(static_cast<size_t>(pslMembers->nItem), sizeof(RAIDSBENTRY))));
    if (!entries)
        return Fail(ERR_OUT_OF_MEMORY);
    int count = 0;
    for (int i = 0; i < pslMembers->nItem; ++i) {
        RAIDSBENTRY &entry = entries.Get()[count];
        const int result = RAIDSBGet(pslMembers->pszItem[i], &entry.superblock);
        if (result < 0)
            return -1;
        if (result == 0 || entry.superblock.szUuid[0] == 0)
            continue;
        tavo::CopyBounded(entry.szMember, pslMembers->pszItem[i]);
        ++count;
    }
    if (count > 0)
        *ppEntry = entries.Release();
    return count;
}
