// Releases locks that this process holds.
#include "tavo_lock.h"

#include "core/detail/fault.h"
#include "core/detail/owner.h"

#include <sys/file.h>

extern "C" int ErrTLIBFileUnlock(unsigned int mask)
{
    int result = 0;
    for (TLIBLOCKFILE *entry = rgslckList; entry->fLockBit != 0; ++entry) {
        if (!entry->pfLock || (entry->fLockBit & mask) == 0)
            continue;
        if (entry->nRef >= 2) {
            --entry->nRef;
            continue;
        }
        const tavo::File stream(std::exchange(entry->pfLock, nullptr));
        entry->nRef = 0;
        if (::flock(stream.Descriptor(), LOCK_UN) != 0)
            result = Fail(ERR_UNLOCK_FAILED, Line{38});
    }
    return result;
}
