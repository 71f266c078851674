// Reads when the domain part of a store was last refreshed.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/fault.h"

extern "C" int TAVOBDbDomainExpireTimeGet(TAVOBDB *pDb, int32_t *pTime)
{
    if (!pDb || !pTime)
        return Fail(ERR_BAD_PARAMETERS);
    const int code = tavo::Btree::Of(pDb)->GetNumber(tavo::kExpireKey, *pTime);
    return code == 0 ? 0 : Fail(code);
}
