// Tells whether the domain part of a store is stale.
#include "tavo_bdb.h"

#include "account/detail/btree.h"

#include <ctime>

namespace {

constexpr uint32_t kFreshSeconds = 300;

}  // namespace

extern "C" int TAVOBDbIsNeedToDomainRebuild(TAVOBDB *pDb)
{
    int32_t stored = 0;
    if (!pDb || tavo::Btree::Of(pDb)->GetNumber(tavo::kExpireKey, stored) != 0)
        return 1;
    // As unsigned numbers: after the clock was set back the difference is huge, and the part is refreshed.
    const uint32_t age = static_cast<uint32_t>(std::time(nullptr)) - static_cast<uint32_t>(stored);
    return age > kFreshSeconds ? 1 : 0;
}
