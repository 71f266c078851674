// Keeps some of the inherited locks in a freshly forked child and closes the others.
#include "tavo_lock.h"

#include "core/detail/fault.h"
#include "core/detail/owner.h"

extern "C" int ErrTLIBFileResetLock(unsigned int mask)
{
    int result = 0;
    for (TLIBLOCKFILE *entry = rgslckList; entry->fLockBit != 0; ++entry) {
        if (entry->pfLock && (entry->fLockBit & mask) != 0) {
            entry->nRef = 1;
            continue;
        }
        // Only closes: unlocking would release the parent's lock, which belongs to the same open file.
        tavo::File stream(std::exchange(entry->pfLock, nullptr));
        entry->nRef = 0;
        if (!stream.Close())
            result = Fail(ERR_UNLOCK_FAILED);
    }
    return result;
}
