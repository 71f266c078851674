// Checks whether the domain part of a store is stale.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "account/detail/domain_part.h"

#include <ctime>

extern "C" int TAVOBDbIsNeedToDomainRebuild(TAVOBDB *pDb)
{
    int32_t stored = 0;
    if (!pDb || tavo::Btree::Of(pDb)->GetNumber(tavo::kExpireKey, stored) != 0)
        return 1;
    return tavo::IsDomainPartFresh(stored, std::time(nullptr)) ? 0 : 1;
}
