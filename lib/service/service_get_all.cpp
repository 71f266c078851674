// Lists the services that the model supports.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"

#include <algorithm>

namespace {

// Several data folders serve one service; the model has the service when it has any of them.
bool IsSupported(const TAVOSERVICE &service)
{
    const auto shares = tavo::SharesOf(service);
    return shares.empty() || std::any_of(shares.begin(), shares.end(), [](int32_t id) {
               TAVOSERVICESHARE share;
               return TAVOServiceSettingGet(id, &share) >= 0 && share.fSupported;
           });
}

}  // namespace

extern "C" int TAVOServiceGetAll(TLIBSZLIST **ppNames)
{
    if (!ppNames || !*ppNames)
        return Fail(ERR_BAD_PARAMETERS);
    int count = 0;
    for (int id = 0; id < tavo::kServices; ++id) {
        if (!IsSupported(tavo::service_table[id]))
            continue;
        if (TLIBSzListPush(ppNames, tavo::service_table[id].szName) < 0)
            return Fail(ERR_OUT_OF_MEMORY);
        ++count;
    }
    return count;
}
