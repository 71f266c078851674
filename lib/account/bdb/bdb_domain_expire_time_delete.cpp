// Forgets when the domain part of a store was refreshed.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/guard.h"

extern "C" int TAVOBDbDomainExpireTimeDelete(TAVOBDB *pDb)
{
    if (!pDb)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const int code = tavo::Btree::Of(pDb)->Delete(tavo::kExpireKey);
        return code == 0 ? 0 : Fail(code);
    });
}
