// Releases the data folders of a service that no other enabled service uses.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"
#include "service/detail/switched_on.h"

#include <algorithm>
#include <string_view>

namespace {

bool IsUsedByAnother(const TAVOSERVICE &service, int32_t share)
{
    return std::any_of(tavo::service_table, tavo::service_table + tavo::kServices, [&](const TAVOSERVICE &other) {
        return std::string_view(other.szName) != service.szName && tavo::UsesShare(other, share) &&
               tavo::IsSwitchedOn(other);
    });
}

}  // namespace

extern "C" int TAVOServiceRemovebyInfo(const TAVOSERVICE *pService, int fDelete)
{
    if (!pService)
        return Fail(ERR_BAD_PARAMETERS);
    bool done = true;
    for (const int32_t share : tavo::SharesOf(*pService)) {
        if (!IsUsedByAnother(*pService, share))
            done = TAVOServiceRemove(share, fDelete) == 0 && done;
    }
    if (!done)
        return Fail(ERR_SERVICE_REMOVE);
    return 0;
}
