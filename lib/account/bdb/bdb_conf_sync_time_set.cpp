// Records the modification time of the text file that a store agrees with.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

#include <cerrno>

extern "C" int TAVOBDbConfSyncTimeSet(TAVOBDB *pDb, int64_t time)
{
    if (!pDb)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (const tavo::Code code = tavo::Btree::Of(pDb)->SetNumber(tavo::kSyncTimeKey, static_cast<int32_t>(time))) {
            LogError("%s:%d Failed to store a key, errno=%d", errno);
            return Fail(code);
        }
        return 0;
    });
}
