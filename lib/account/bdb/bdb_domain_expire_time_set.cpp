// Records that the domain part of a store is fresh now.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

#include <cerrno>
#include <ctime>

extern "C" int TAVOBDbDomainExpireTimeSet(TAVOBDB *pDb)
{
    if (!pDb)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (const tavo::Code code =
                tavo::Btree::Of(pDb)->SetNumber(tavo::kExpireKey, static_cast<int32_t>(std::time(nullptr)))) {
            LogError("%s:%d Failed to store a key, errno=%d", errno);
            return Fail(code);
        }
        return 0;
    });
}
