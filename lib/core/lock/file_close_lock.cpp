// Closes every inherited lock in a freshly forked child.
#include "tavo_lock.h"

#include "core/detail/fault.h"
#include "core/detail/owner.h"

extern "C" int ErrTLIBFileCloseLock(void)
{
    int result = 0;
    for (TLIBLOCKFILE *entry = rgslckList; entry->fLockBit != 0; ++entry) {
        // Only closes: unlocking would release the parent's lock, which belongs to the same open file.
        tavo::File stream(std::exchange(entry->pfLock, nullptr));
        entry->nRef = 0;
        if (!stream.Close())
            result = Fail(ERR_UNLOCK_FAILED);
    }
    return result;
}
